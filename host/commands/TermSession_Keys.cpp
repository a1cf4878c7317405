// SPDX-License-Identifier: Apache-2.0
#include <nlohmann/json.hpp>
#include <sstream>

#include "host/commands/InstanceAccess.h"
#include "host/commands/SettingText.h"
#include "host/commands/StatsText.h"
#include "host/commands/TermSession.h"
#include "host/instance/Instance.h"
#include "host/instance/TrapHints.h"
#include "host/term/LineEditor.h"
#include "host/text/ByteText.h"
#include "host/text/Output.h"

namespace {

using Json = nlohmann::json;

void TellLines(const std::string& text) {
  std::istringstream stream(text);
  for (std::string line; std::getline(stream, line);) {
    TellUser(line);
  }
}

// "DTR on  RTS off  ...": ours in front.
std::string ModemLineText(const Json& lines) {
  if (lines.empty()) {
    return "this line has no modem lines";
  }
  constexpr std::pair<const char*, const char*> kLines[] = {
      {"dtr", "DTR"}, {"rts", "RTS"}, {"cts", "CTS"}, {"dsr", "DSR"}, {"dcd", "DCD"}, {"ri", "RI"}};
  std::string text;
  for (const auto& [key, name] : kLines) {
    text +=
        (text.empty() ? "" : "  ") + std::string(name) + (lines.value(key, false) ? " on" : " off");
  }
  return text;
}

std::string TokenCount(unsigned int count) {
  return std::to_string(count) + (count == 1 ? " token" : " tokens");
}

}  // namespace

void TermSession::HandleKey(char typed) {
  const std::optional<TermKey> key = FindTermKey(typed);
  Above([&] {
    if (key) {
      CarryOut(*key);
    } else {
      TellUser("ctrl-t " + EscapeBytes(std::string(1, typed)) + " is no key; ctrl-t ? lists them");
    }
  });
}

void TermSession::CarryOut(TermKey key) {
  switch (key) {
    case TermKey::kList:
      TellLines(TermKeyList());
      break;
    case TermKey::kQuit:
      isEnding_ = true;
      break;
    case TermKey::kSettings:
      ShowSettings();
      break;
    case TermKey::kOutputMode:
      settings_.outputMode = NextOf(settings_.outputMode);
      MakePrinter();
      TellUser(std::string("output: ") + NameOf(settings_.outputMode) +
               (settings_.outputMode == OutputMode::kRaw ? ", bytes are not escaped" : ""));
      break;
    case TermKey::kInputMode:
      settings_.inputMode = NextOf(settings_.inputMode);
      SetPrompt();
      TellUser(std::string("input: ") + NameOf(settings_.inputMode));
      break;
    case TermKey::kTime:
      settings_.hasTime = !settings_.hasTime;
      MakePrinter();
      TellUser(std::string("time stamps ") + (settings_.hasTime ? "on" : "off"));
      break;
    case TermKey::kLog:
      SwitchLog();
      break;
    case TermKey::kStatistics:
      ShowStatistics();
      break;
    case TermKey::kAcknowledge:
    case TermKey::kAcknowledgeAll:
      Acknowledge(key == TermKey::kAcknowledgeAll);
      break;
    case TermKey::kDone:
      ApplyStaged();
      break;
    case TermKey::kModemLines:
      ShowModemLines();
      break;
    case TermKey::kSendPrefix:
      Send(std::string(1, kTermKeyPrefix));
      break;
  }
}

void TermSession::ShowSettings() {
  Answer answer = Call({{"op", "settings"}});
  if (answer.IsDone()) {
    const SettingRows rows = answer.data.value("rows", SettingRows());
    TellLines(SettingsTable(rows));
    AddConsoleHints(rows, &answer.hints);
  }
  Tell(answer);
}

void TermSession::ShowStatistics() {
  const Answer answer = Call({{"op", "stats"}});
  if (answer.data.contains("drops")) {
    TellUser(StatsText(answer.data));
  }
  Tell(answer);
}

void TermSession::ShowModemLines() {
  const Answer answer = Call({{"op", "lines"}});
  if (answer.IsDone() && !isEnding_) {
    TellUser(ModemLineText(answer.data));
  }
  Tell(answer);
}

void TermSession::Acknowledge(bool isAll) {
  const Answer answer = Call({{"op", "ack"}, {"all", isAll}});
  if (answer.data.contains("dropped")) {
    const auto dropped = answer.data.value("dropped", 0U);
    TellUser(dropped == 0 ? "no token is waiting" : TokenCount(dropped) + " acknowledged");
  }
  Tell(answer);
}

void TermSession::ApplyStaged() {
  Answer answer = Call({{"op", "done"}});
  if (answer.data.contains("applied")) {
    const std::string changes = AlsoAppliedText(answer.data, {});
    TellUser(AppliedText(answer.data) + (changes.empty() ? "" : ": " + changes));
    DropClearedHint(&answer);
  }
  Tell(answer);
}

void TermSession::SwitchLog() {
  if (log_ != nullptr) {
    log_.reset();
    TellUser("log off: " + EscapeBytes(settings_.logFile));
  } else if (!settings_.logFile.empty()) {
    BeginLog(settings_.logFile);
  } else {
    AskForLog();
  }
}

// The next line is the name; what was being typed comes back behind it.
void TermSession::AskForLog() {
  setAside_ = editor_->TakeTyped();
  isNamingLog_ = true;
  SetPrompt();
  TellUser("name of the log file? (an empty line: none)");
}

void TermSession::BeginLog(const std::string& path) {
  std::string error;
  log_ = LogFile::Open(
      path, [this](const std::string& text) { logProblem_ = text; }, &error);
  if (log_ == nullptr) {
    Tell(Refusal(EscapeBytes(error)));
    return;
  }
  settings_.logFile = path;
  if (!settings_.isQuiet) {
    TellUser("log on: " + EscapeBytes(path));
  }
}
