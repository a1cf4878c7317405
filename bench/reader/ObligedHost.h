// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <memory>

#include "interfaces/ISemaphore.h"
#include "interfaces/ISerialPort.h"

// The plainest host objects that the obligation allows, behind the same interfaces as ours and in a
// file of their own, so that no call is optimised away.

// A port that gives bytes from blocks of 4096 and calls `onPause` before it waits for more.
std::unique_ptr<ISerialPort> MakePlainPort(int line, std::function<void()> onPause);

// A std::mutex.
std::unique_ptr<ISemaphore> MakeMutexSemaphore();
