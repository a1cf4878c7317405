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

std::string RoleText(const BytesLabelled& labelled, const TextStyle& style) {
  const std::string text = HexBytes(labelled.bytes) + " " + labelled.role;
  return labelled.role == NameOf(ByteRole::kBody) ? text : style.Dim(text);
}

// Sent bytes cyan, dropped ones and findings red, what the host has to say bold.
std::string Coloured(const HostEvent& event, const TextStyle& style) {
  const std::string text = EventText(event);
  if (std::holds_alternative<BytesSent>(event.detail)) {
    return style.Cyan(text);
  }
  if (std::holds_alternative<BytesDropped>(event.detail) ||
      std::holds_alternative<FindingMade>(event.detail)) {
    return style.Red(text);
  }
  const bool isHostMessage = std::holds_alternative<PortChanged>(event.detail) ||
                             std::holds_alternative<NoteMade>(event.detail);
  return isHostMessage ? style.Bold(text) : text;
}

std::string JoinLines(const std::vector<std::string>& lines) {
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
  const auto* const labelled = std::get_if<BytesLabelled>(&event.detail);
  if (options_.form == PrintOptions::Form::kJson) {
    if (IsWanted(event)) {
      isOutputGone_ = !WriteResult(ToJsonLine(event) + "\n") || isOutputGone_;
    }
  } else if (labelled != nullptr) {
    roles_ += (roles_.empty() ? "" : "  ") + RoleText(*labelled, errorStyle_);
  } else if (token != nullptr && !options_.isRaw) {
    TellRoles();
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
  if (std::holds_alternative<BytesLabelled>(event.detail)) {
    return options_.verbosity >= 2;
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
      WriteLine(event,
                "rx " + (token.frame.empty()
                             ? HexDump(token.bytes)
                             : HexDump(token.frame, static_cast<std::size_t>(token.prefixBytes),
                                       static_cast<std::size_t>(token.suffixBytes), style_)));
      break;
    case PrintOptions::Form::kFormat:
      WriteLine(event, options_.format.Write(event));
      break;
    default:
      WriteLine(event, EscapeBytes(token.bytes));
      break;
  }
  if (token.isCut && !options_.isQuiet) {
    TellUser(JoinLines(HintsForCutToken(token.bytes.size(), token.lengthBytes)));
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

// One line a frame: "02 prefix  41 42 body  03 suffix".
void EventPrinter::TellRoles() {
  if (!roles_.empty() && options_.verbosity >= 2 && !options_.isQuiet) {
    TellUser(roles_);
  }
  roles_.clear();
}

// What a reason means is said once.
void EventPrinter::TellEvent(const HostEvent& event) {
  TellRoles();
  TellUser(Coloured(event, errorStyle_));
  const auto* const drop = std::get_if<BytesDropped>(&event.detail);
  if (drop != nullptr && hintedReasons_.insert(drop->reason).second) {
    const std::string hint = HintForDropReason(drop->reason);
    if (!hint.empty()) {
      TellUser("  " + hint);
    }
  }
}
