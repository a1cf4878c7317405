// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

// What a line does, written down: bytes and silences in their order.
struct LineEvent {
  std::string bytes;  // empty: a silence
  int silenceMs = 0;  // 0 with no bytes: as long as the gap
};

using LineScript = std::vector<LineEvent>;

// Reads words: bytes as ParseControlText takes them, "~" for a silence as long as the gap, "~500"
// for one of 500 ms. False, with the reason in `error`, for any other word. Any thread.
bool ParseLineWords(const std::vector<std::string>& words, LineScript* script, std::string* error);

// The same with one exception: a single word that cannot be read so is the name of a file, and "-"
// is standard input. The file's bytes are taken as they stand, without silences, or as words where
// `hasWords` is set ('#' begins a comment up to the end of the line). At most 64 MiB. Any thread.
bool ReadLineScript(const std::vector<std::string>& words, bool hasWords, LineScript* script,
                    std::string* error);
