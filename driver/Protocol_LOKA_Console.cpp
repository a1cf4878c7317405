// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <array>
#include <cstring>

#include "driver/ConsoleTexts_LOKA.h"
#include "driver/Protocol_LOKA.h"
#include "driver/Texts_LOKA.h"
#include "protlib/ConsoleCommand.h"
#include "protlib/ParseInt.h"
#include "protlib/SemaphoreLock.h"

// What the console changes is the running settings only: nothing is staged and nothing is stored.
// No command but "connect" takes a semaphore of the host; a command that reads or writes a tag does
// what that tag does.

namespace {

constexpr const char* kPutCommand = "put";

}  // namespace

struct Protocol_LOKA::ConsoleHandler {
  const char* name;
  bool (Protocol_LOKA::*run)(const ConsoleCommand& command);
};

bool Protocol_LOKA::DoCommand(const char* command, char* reply, int sizeBytes) {
  static constexpr std::array<ConsoleHandler, 14> kHandlers = {{
      {"help", &Protocol_LOKA::CommandHelp},
      {"connect", &Protocol_LOKA::CommandConnect},
      {"get_stat", &Protocol_LOKA::CommandGetStat},
      {kPutCommand, &Protocol_LOKA::CommandPut},
      {"get", &Protocol_LOKA::CommandGet},
      {"tokens_available", &Protocol_LOKA::CommandTokensAvailable},
      {"get_token_length", &Protocol_LOKA::CommandGetTokenLength},
      {"token_ack", &Protocol_LOKA::CommandTokenAck},
      {"set_hexToken", &Protocol_LOKA::CommandSetHexToken},
      {"set_rxGap", &Protocol_LOKA::CommandSetRxGap},
      {"set_rxPrefix", &Protocol_LOKA::CommandSetFraming<FramingText::kRxPrefix>},
      {"set_rxSuffix", &Protocol_LOKA::CommandSetFraming<FramingText::kRxSuffix>},
      {"set_txPrefix", &Protocol_LOKA::CommandSetFraming<FramingText::kTxPrefix>},
      {"set_txSuffix", &Protocol_LOKA::CommandSetFraming<FramingText::kTxSuffix>},
  }};
  if (command == nullptr) {
    return false;
  }
  return Guarded(false, [&] {
    const ConsoleCommand parsed(command, reply, sizeBytes);
    const auto* handler = std::find_if(
        kHandlers.begin(), kHandlers.end(),
        [&parsed](const ConsoleHandler& entry) { return parsed.Name() == entry.name; });
    return handler != kHandlers.end() ? (this->*handler->run)(parsed)
                                      : ProtocolBase::DoCommand(command, reply, sizeBytes);
  });
}

// The generic text, and the driver's own behind it as far as there is room.
bool Protocol_LOKA::CommandHelp(const ConsoleCommand& command) {
  char* reply = command.Reply();
  int room = command.ReplyBytes();
  if (ProtocolBase::DoCommand(command.Line(), reply, room) && reply != nullptr && room > 0) {
    const auto* end =
        static_cast<const char*>(std::memchr(reply, 0, static_cast<std::size_t>(room)));
    const int used = end == nullptr ? room : static_cast<int>(end - reply);
    reply += used;
    room -= used;
  }
  BoundedCopy(reply, ConsoleTexts_LOKA::kHelp, room);
  return true;
}

bool Protocol_LOKA::CommandConnect(const ConsoleCommand& command) {
  if (!command.HasArgument()) {
    return command.Answer(ConsoleTexts_LOKA::kConnectStateMissing, false);
  }
  if (command.Argument() == ConsoleTexts_LOKA::kOff) {
    if (link_.IsConnected()) {
      link_.Disconnect();
      ClosePortUnderSemaphore();
    }
    return command.Answer(ConsoleTexts_LOKA::kOk, true);
  }
  if (command.Argument() == ConsoleTexts_LOKA::kOn) {
    const SemaphoreLock lock(portSemaphore_, LockRank::kPortSemaphore);
    const bool isOpen = link_.Open(portName_, settings_.Serial());
    return command.Answer(isOpen ? ConsoleTexts_LOKA::kOk : Texts_LOKA::kCannotOpenPort, true);
  }
  return command.Answer(ConsoleTexts_LOKA::kWrongValue, false);
}

bool Protocol_LOKA::CommandGetStat(const ConsoleCommand& command) {
  return command.Answer(
      link_.IsConnected() ? ConsoleTexts_LOKA::kConnected : ConsoleTexts_LOKA::kDisconnected, true);
}

// The token is the rest of the line as it stands, inner and trailing blanks included.
bool Protocol_LOKA::CommandPut(const ConsoleCommand& command) {
  if (!command.HasArgument()) {
    return command.Answer(ConsoleTexts_LOKA::kStringMissing, false);
  }
  const char* text = std::strstr(command.Line(), kPutCommand) + std::strlen(kPutCommand);
  text += std::strspn(text, " ");
  switch (TrySend(text)) {
    case SendResult::kNotHex:
      return command.Answer(ConsoleTexts_LOKA::kTokenNotHex, false);
    case SendResult::kNotActive:
      return command.Answer(ConsoleTexts_LOKA::kNotActive, false);
    case SendResult::kSent:
      break;
  }
  return command.Answer(ConsoleTexts_LOKA::kOk, true);
}

bool Protocol_LOKA::CommandGet(const ConsoleCommand& command) {
  return command.Answer(tokens_.Front(), true);
}

bool Protocol_LOKA::CommandTokensAvailable(const ConsoleCommand& command) {
  return command.Answer(std::to_string(tokens_.Count()), true);
}

bool Protocol_LOKA::CommandGetTokenLength(const ConsoleCommand& command) {
  return command.Answer(std::to_string(tokens_.FrontLength()), true);
}

bool Protocol_LOKA::CommandTokenAck(const ConsoleCommand& command) {
  constexpr std::size_t kWordsForAll = 2;
  if (command.WordCount() == kWordsForAll && command.Argument() == ConsoleTexts_LOKA::kAll) {
    tokens_.Clear();
  } else {
    tokens_.PopFront();
  }
  return command.Answer(ConsoleTexts_LOKA::kOk, true);
}

// A wrong value counts as answered, here and for the gap: consoles in the field rely on it.
bool Protocol_LOKA::CommandSetHexToken(const ConsoleCommand& command) {
  if (!command.HasArgument()) {
    return command.Answer(ConsoleTexts_LOKA::kNewValueMissing, false);
  }
  const bool isOn = command.Argument() == ConsoleTexts_LOKA::kOn;
  if (!isOn && command.Argument() != ConsoleTexts_LOKA::kOff) {
    return command.Answer(ConsoleTexts_LOKA::kWrongValue, true);
  }
  settings_.SetHexTokens(isOn);
  return command.Answer(ConsoleTexts_LOKA::kOk, true);
}

bool Protocol_LOKA::CommandSetRxGap(const ConsoleCommand& command) {
  if (!command.HasArgument()) {
    return command.Answer(ConsoleTexts_LOKA::kNewValueMissing, false);
  }
  const char* const text = command.Argument().c_str();
  const char* end = nullptr;
  const int gapMs = ParseInt(text, 10, &end);
  if (end == text) {
    return command.Answer(ConsoleTexts_LOKA::kWrongValue, true);
  }
  settings_.SetGapMs(gapMs);
  return command.Answer(ConsoleTexts_LOKA::kOk, true);
}

// Takes the text as it is, hex text or not.
template <FramingText Which>
bool Protocol_LOKA::CommandSetFraming(const ConsoleCommand& command) {
  if (!command.HasArgument()) {
    return command.Answer(ConsoleTexts_LOKA::kNewValueMissing, false);
  }
  settings_.SetText(Which, command.Argument());
  return command.Answer(ConsoleTexts_LOKA::kOk, true);
}
