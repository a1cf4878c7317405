// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "protlib/BoundedCopy.h"
#include "protlib/ProtUtilsN.h"

// One command line of the diagnostic console with the place for its reply. Words are cut at every
// blank, so two blanks in a row make an empty word. May throw std::bad_alloc when it is built.
class ConsoleCommand {
 public:
  // `line` and `reply` stay owned by the caller.
  ConsoleCommand(const char* line, char* reply, int replyBytes)
      : line_(line), reply_(reply), replyBytes_(replyBytes) {
    ProtUtilsN::ParseSubstrings(line, words_, ' ');
  }

  const char* Line() const { return line_; }
  std::size_t WordCount() const { return words_.size(); }
  const std::string& Word(std::size_t index) const { return words_[index]; }
  const std::string& Name() const { return words_.front(); }

  // The second word, when there is one.
  bool HasArgument() const { return words_.size() > 1; }
  const std::string& Argument() const { return words_[1]; }

  char* Reply() const { return reply_; }
  int ReplyBytes() const { return replyBytes_; }

  // Sets the reply and hands the result through.
  bool Answer(const char* text, bool result) const {
    BoundedCopy(reply_, text, replyBytes_);
    return result;
  }
  bool Answer(const std::string& text, bool result) const { return Answer(text.c_str(), result); }

 private:
  const char* line_;
  char* reply_;
  int replyBytes_;
  std::vector<std::string> words_;
};
