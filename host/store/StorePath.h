// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

// Where the store stands when nothing else is said: loka/store.db in $XDG_STATE_HOME, else in
// ~/.local/state (XDG Base Directory Specification; a relative $XDG_STATE_HOME is ignored as it
// asks). Empty when there is no home folder either. Start of the program.
std::string DefaultStorePath();
