// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/events/HostEvent.h"

// One event as one line for people, without its line end, device bytes escaped: for the messages
// beside the tokens and for the log. Any thread.
std::string EventText(const HostEvent& event);
