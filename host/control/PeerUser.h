// SPDX-License-Identifier: Apache-2.0
#pragma once

// True when the process at the other end of a connected local socket runs as our user or as root
// (SO_PEERCRED, unix(7)). For the end that connects, the other one is the process that listens. Any
// thread.
bool IsPeerTrusted(int descriptor);
