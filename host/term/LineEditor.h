// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>

// The line that is being typed at a terminal, with the usual editing keys and a history, and what
// has to be done so that other lines can be printed above it. One thread.
class LineEditor {
 public:
  // The next byte that was typed; nothing ends the line unfinished. May print between Hide and
  // Show.
  using NextByte = std::function<std::optional<char>()>;

  // Whether this program has it (a build option).
  static bool IsBuiltIn();

  // Edits on the terminal behind `keysDescriptor` and draws on the one behind `screenDescriptor`.
  // An empty history file keeps none. Null, with the reason in `error`, when that cannot be.
  static std::unique_ptr<LineEditor> Make(int keysDescriptor, int screenDescriptor,
                                          const std::string& historyFile, std::string* error);

  LineEditor() = default;
  virtual ~LineEditor() = default;
  LineEditor(const LineEditor&) = delete;
  LineEditor& operator=(const LineEditor&) = delete;

  // Reads a line, as UTF-8 without its end; nothing when it was left unfinished or when ctrl-d was
  // typed on an empty line. Throws what nextByte throws.
  virtual std::optional<std::string> ReadLine(const NextByte& nextByte) = 0;

  // ASCII. Shown from the next ReadLine or Show on.
  virtual void SetPrompt(const std::string& prompt) = 0;

  // Takes the prompt and the line off the screen, and puts them back. Harmless outside ReadLine.
  virtual void Hide() = 0;
  virtual void Show() = 0;

  // Takes away what is typed so far, while a line is read.
  virtual std::string TakeTyped() = 0;

  // What the next ReadLine starts with.
  virtual void StartWith(const std::string& typed) = 0;

  // Puts a line into the history.
  virtual void Remember(const std::string& line) = 0;
};
