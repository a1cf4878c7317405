// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

// Where the control sockets of running instances are: $LOKA_RUNTIME_DIR, else
// $XDG_RUNTIME_DIR/loka, else /tmp/loka-UID. Each is named after the port of its instance, as in
// com1.sock. All functions: any thread.

std::string ControlFolder();

// "FOLDER/com1.sock".
std::string ControlPath(const std::string& instanceName);

// Names of the instances that have a socket there, whether or not anybody listens, in order.
std::vector<std::string> ControlNames();

// Makes the folder, mode 0700. False, with the reason in `error`, when that fails or when the
// folder belongs to another user or lets others in.
bool MakeControlFolder(std::string* error);
