// SPDX-License-Identifier: Apache-2.0
#include "host/commands/EventPrinter.h"

#include "host/events/EventJson.h"
#include "host/events/EventText.h"
#include "host/events/HexDump.h"
#include "host/events/WallClock.h"
#include "host/framing/ByteRole.h"
#include "host/instance/TrapHints.h"
#include "host/text/ByteText.h"
#include "host/text/Output.h"

namespace {

// The events carry reasons by name, since they also come from other processes.
std::string HintForDropReason(const std::string& name) {
  for (int code = 0; code <= static_cast<int>(DropReason::kQueueFull); ++code) {
    const auto reason = static_cast<DropReason>(code);
    if (name == NameOf(reason)) {
      return HintFor(reason);
    }
  }
  return "";
}

std::string Join(const std::vector<std::string>& lines) {
  std::string text;
  for (const std::string& line : lines) {
    text += (text.empty() ? "" : "; ") + line;
  }
  return text;
}

}  // namespace

void EventPrinter::OnEvent(const HostEvent& event) {
  const auto* const token = std::get_if<TokenReceived>(&event.detail);
  const auto* const received = std::get_if<BytesReceived>(&event.detail);
  if (options_.form == PrintOptions::Form::kJson) {
    if (IsWanted(event)) {
      isOutputGone_ = !WriteResult(ToJsonLine(event) + "\n") || isOutputGone_;
    }
  } else if (token != nullptr && !options_.isRaw) {
    PrintToken(event, *token);
  } else if (received != nullptr && options_.isRaw) {
    PrintRaw(event, *received);
  } else if (IsWanted(event)) {
    TellEvent(event);
  }
  tokenCount_ += token != nullptr ? 1 : 0;
}

bool EventPrinter::IsWanted(const HostEvent& event) const {
  if (std::holds_alternative<TokenReceived>(event.detail)) {
    return !options_.isRaw;
  }
  if (options_.isQuiet) {
    return false;
  }
  if (std::holds_alternative<BytesReceived>(event.detail)) {
    return options_.isRaw || options_.verbosity >= 2;
  }
  const bool isDetail = std::holds_alternative<BytesSent>(event.detail) ||
                        std::holds_alternative<SettingChanged>(event.detail) ||
                        std::holds_alternative<ConsoleReplied>(event.detail);
  return !isDetail || options_.verbosity >= 1;
}

void EventPrinter::WriteLine(const HostEvent& event, const std::string& text) {
  const std::string time = options_.hasTime ? LocalTimeText(event.timeUs) + " " : "";
  isOutputGone_ = !WriteResult(time + text + "\n") || isOutputGone_;
}

void EventPrinter::PrintToken(const HostEvent& event, const TokenReceived& token) {
  switch (options_.form) {
    case PrintOptions::Form::kHex:
      WriteLine(event, HexBytes(token.bytes));
      break;
    case PrintOptions::Form::kDump:
      WriteLine(event, "rx " + HexDump(token.frame.empty() ? token.bytes : token.frame));
      break;
    case PrintOptions::Form::kFormat:
      WriteLine(event, options_.format.Write(event));
      break;
    default:
      WriteLine(event, EscapeBytes(token.bytes));
      break;
  }
  if (token.isCut && !options_.isQuiet) {
    TellUser(Join(HintsForCutToken(token.bytes.size(), token.lengthBytes)));
  }
}

void EventPrinter::PrintRaw(const HostEvent& event, const BytesReceived& received) {
  switch (options_.form) {
    case PrintOptions::Form::kHex:
      WriteLine(event, HexBytes(received.bytes));
      break;
    case PrintOptions::Form::kDump:
      WriteLine(event, "rx " + HexDump(received.bytes));
      break;
    default:
      WriteLine(event, EscapeBytes(received.bytes));
      break;
  }
}

// What a reason means is said once.
void EventPrinter::TellEvent(const HostEvent& event) {
  TellUser(EventText(event));
  const auto* const drop = std::get_if<BytesDropped>(&event.detail);
  if (drop != nullptr && hintedReasons_.insert(drop->reason).second) {
    const std::string hint = HintForDropReason(drop->reason);
    if (!hint.empty()) {
      TellUser("  " + hint);
    }
  }
}
