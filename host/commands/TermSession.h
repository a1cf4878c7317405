// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>

#include "host/base/Deadline.h"
#include "host/commands/EventPrinter.h"
#include "host/instance/Answer.h"
#include "host/log/LogFile.h"
#include "host/term/EventInbox.h"
#include "host/term/TermKeys.h"
#include "host/term/TermModes.h"

class EventStream;
class Instance;
class KeyInput;
class LineEditor;

// What happens in `term` between its start and its end: lines are sent, tokens shown above the line
// that is being typed, keys carried out. All on the one thread that calls the instance.
class TermSession {
 public:
  struct Settings {
    InputMode inputMode = InputMode::kText;
    OutputMode outputMode = OutputMode::kText;
    std::string logFile;  // empty: none
    bool hasTime = false;
    bool isQuiet = false;
    int verbosity = 0;
    std::string colour = "auto";  // as TextStyle takes it
    int lingerMs = 0;             // behind the end of an input that is no terminal
  };

  // `events` is the stream of an instance of this process, null for another one's: events that come
  // while a request is carried out would be lost otherwise. `editor` is null when lines are read as
  // they come. All must outlive the session.
  TermSession(Instance* instance, EventStream* events, LineEditor* editor, Settings settings);
  ~TermSession();

  TermSession(const TermSession&) = delete;
  TermSession& operator=(const TermSession&) = delete;

  // Returns when the user quits, at the end of the input, and when the line or the instance is gone
  // or a signal came. Without an editor the status is that of the first line that was refused.
  Answer Run();

 private:
  void RunWithKeys();
  void RunWithLines();
  std::optional<char> NextByte();
  bool Wait(const Deadline& deadline, const std::function<bool()>& hasInput);
  void ShowEvents();
  void ShowEvent(const HostEvent& event);
  void Above(const std::function<void()>& print);
  void MakePrinter();
  void SetPrompt();

  // Lines.
  void HandleTyped(const std::string& line);
  void HandleLine(const std::string& line);
  void Send(const std::string& bytes);
  void RunConsole(const std::string& line);
  Answer Call(const nlohmann::json& request);
  void Tell(const Answer& answer);
  void Refuse(const std::string& text);

  // Keys.
  void HandleKey(char typed);
  void CarryOut(TermKey key);
  void ShowSettings();
  void ShowStatistics();
  void ShowModemLines();
  void Acknowledge(bool isAll);
  void ApplyStaged();
  void SwitchLog();
  void AskForLog();
  void BeginLog(const std::string& path);

  Instance* const instance_;
  EventStream* const events_;
  LineEditor* const editor_;
  Settings settings_;
  EventInbox inbox_;
  std::optional<EventPrinter> printer_;
  std::unique_ptr<KeyInput> input_;
  std::unique_ptr<LogFile> log_;
  std::string logProblem_;

  bool isPrefixTyped_ = false;
  bool isNamingLog_ = false;  // the line that is typed is the name of the log file
  std::string setAside_;      // what was typed before that
  bool isEnding_ = false;
  Answer end_;
};
