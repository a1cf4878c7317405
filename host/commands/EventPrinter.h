// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <set>
#include <string>

#include "host/events/EventSink.h"
#include "host/events/TokenFormat.h"
#include "host/text/TextStyle.h"

// How a command shows events.
struct PrintOptions {
  enum class Form { kText, kHex, kDump, kJson, kFormat };

  Form form = Form::kText;
  TokenFormat format;    // for kFormat
  bool hasTime = false;  // the time of day in front of each token
  bool isRaw = false;    // bytes as they come instead of tokens
  bool isQuiet = false;  // nothing beside the tokens
  int verbosity = 0;     // 1: sent bytes and settings too; 2: received bytes and every role too
  std::string colour;    // as TextStyle takes it
};

// Prints tokens on standard output and what else happens on standard error. With kJson everything
// goes to standard output, one object a line. One thread.
class EventPrinter final : public EventSink {
 public:
  explicit EventPrinter(PrintOptions options)
      : options_(std::move(options)),
        style_(options_.colour),
        errorStyle_(options_.colour, TextStyle::kStandardError) {}

  void OnEvent(const HostEvent& event) override;

  // Tokens that were printed.
  std::uint64_t TokenCount() const { return tokenCount_; }

  // The port was lost for good, or the output is gone.
  bool IsOutputGone() const { return isOutputGone_; }

 private:
  void PrintToken(const HostEvent& event, const TokenReceived& token);
  void PrintRaw(const HostEvent& event, const BytesReceived& received);
  void TellEvent(const HostEvent& event);
  void TellRoles();
  bool IsWanted(const HostEvent& event) const;
  void WriteLine(const HostEvent& event, const std::string& text);

  const PrintOptions options_;
  const TextStyle style_;       // on standard output
  const TextStyle errorStyle_;  // on standard error
  std::string roles_;           // of the frame whose bytes are being told
  std::uint64_t tokenCount_ = 0;
  bool isOutputGone_ = false;
  std::set<std::string> hintedReasons_;
};
