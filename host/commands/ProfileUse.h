// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/commands/ProfileFile.h"

struct InstanceAccess;

// Fills in what the command line leaves open: from the profile that --profile or the word PORT
// names, then the port from $LOKA_PORT. PORT names a profile when it looks like no path and no port
// word; one that is neither a profile nor a file is refused. What the command line says stays, and
// a --config there keeps all line and framing values of the profile out. False with the reason,
// which names file, section and key, in `error`. Main thread, once, behind the parsing.
bool UseProfile(InstanceAccess* access, std::string* error);

// Whether every key means something and has a value that can be right; the driver and the port have
// the last word. Main thread.
bool CheckProfile(const Profile& profile, std::string* error);
