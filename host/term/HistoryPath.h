// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

// Where the lines typed in `term` are kept: loka/history in $XDG_STATE_HOME, else in
// ~/.local/state; beside the store. Empty when there is no home folder either. Start of the
// program.
std::string HistoryPath();
