// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

struct CommandModel;

// Fills a manual page in scdoc(5) form: a line "@commands@" and the like is replaced by what the
// program knows of itself, so that a page cannot say anything else than --help does.
//
//   @commands@        each command with its options, its words and its example
//   @shared-options@  the options that all commands with a driver have, once
//   @exit-status@, @events@, @port-options@, @configuration-keys@, @settings@
//
// False, with the line in `error`, for a mark that is not one of these. Any thread.
bool FillManualPage(const std::string& page, const CommandModel& root, std::string* filled,
                    std::string* error);
