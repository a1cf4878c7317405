// SPDX-License-Identifier: Apache-2.0
#include "host/commands/TermSession.h"

#include <unistd.h>

#include <limits>
#include <utility>

#include "host/commands/InstanceAccess.h"
#include "host/events/EventStream.h"
#include "host/events/WallClock.h"
#include "host/framing/ControlNames.h"
#include "host/instance/Instance.h"
#include "host/instance/TrapHints.h"
#include "host/term/KeyInput.h"
#include "host/term/LineEditor.h"
#include "host/term/TypedText.h"
#include "host/text/ByteText.h"
#include "host/text/Output.h"
#include "host/text/Utf8Text.h"

namespace {

constexpr int kForeverMs = std::numeric_limits<int>::max();
// Many lines at once must not keep the tokens waiting.
constexpr int kBetweenLinesMs = 1;

// Where the events of an instance's stream come by themselves.
class NoSink final : public EventSink {
 public:
  void OnEvent(const HostEvent& /*event*/) override {}
};

Deadline Never() { return Deadline::After(kForeverMs); }

// What is printed without being asked for with -v.
bool IsShown(const HostEvent& event) {
  return std::holds_alternative<TokenReceived>(event.detail) ||
         std::holds_alternative<BytesDropped>(event.detail) ||
         std::holds_alternative<PortChanged>(event.detail) ||
         std::holds_alternative<NoteMade>(event.detail) ||
         std::holds_alternative<FindingMade>(event.detail);
}

}  // namespace

TermSession::TermSession(Instance* instance, EventStream* events, LineEditor* editor,
                         Settings settings)
    : instance_(instance),
      events_(events),
      editor_(editor),
      settings_(std::move(settings)),
      inbox_([instance] { instance->Wake(); }) {
  MakePrinter();
  if (events_ != nullptr) {
    events_->Add(&inbox_);
  }
}

TermSession::~TermSession() {
  if (events_ != nullptr) {
    events_->Remove(&inbox_);
  }
}

Answer TermSession::Run() {
  end_ = instance_->Subscribe();
  if (!end_.IsDone()) {
    return end_;
  }
  if (!settings_.logFile.empty()) {
    BeginLog(settings_.logFile);
    if (log_ == nullptr) {
      return Refusal("");
    }
  }
  input_ = std::make_unique<KeyInput>(STDIN_FILENO, [this] { instance_->Wake(); });
  if (editor_ != nullptr) {
    RunWithKeys();
  } else {
    RunWithLines();
  }
  ShowEvents();
  input_.reset();
  return end_;
}

void TermSession::RunWithKeys() {
  if (!settings_.isQuiet) {
    TellUser("ctrl-t ? lists the keys, ctrl-t q quits");
  }
  while (!isEnding_) {
    SetPrompt();
    const std::optional<std::string> line = editor_->ReadLine([this] { return NextByte(); });
    if (!line) {
      return;
    }
    HandleTyped(*line);
  }
}

void TermSession::RunWithLines() {
  std::string line;
  while (!isEnding_ && !input_->IsAtEnd()) {
    ShowEvents();
    if (input_->TakeLine(&line)) {
      HandleLine(line);
    } else if (!input_->IsAtEnd()) {
      (void)Wait(Never(), [this] { return input_->HasLine(); });
    }
  }
  const Deadline deadline = Deadline::After(settings_.lingerMs);
  while (!isEnding_ && Wait(deadline, [] { return false; })) {
    ShowEvents();
  }
}

// Keys behind a ctrl-t are carried out in between.
std::optional<char> TermSession::NextByte() {
  char byte = 0;
  while (!isEnding_) {
    ShowEvents();
    if (!input_->TakeByte(&byte)) {
      isEnding_ = isEnding_ || input_->IsAtEnd();
      if (!isEnding_) {
        (void)Wait(Never(), [this] { return input_->HasByte(); });
      }
    } else if (isPrefixTyped_) {
      isPrefixTyped_ = false;
      HandleKey(byte);
    } else if (byte == kTermKeyPrefix) {
      isPrefixTyped_ = true;
    } else {
      return byte;
    }
  }
  return std::nullopt;
}

// Until there is something to do. False at the deadline.
bool TermSession::Wait(const Deadline& deadline, const std::function<bool()>& hasInput) {
  NoSink none;
  EventSink* const sink = events_ == nullptr ? static_cast<EventSink*>(&inbox_) : &none;
  const auto isDone = [&] { return inbox_.HasEvents() || hasInput(); };
  const Answer answer = instance_->Serve(sink, isDone, deadline);
  if (answer.status == ExitStatus::kTimeout) {
    return false;
  }
  if (!answer.IsDone()) {
    end_ = answer;
  }
  isEnding_ = isEnding_ || !answer.IsDone() || instance_->StopSignal() != 0;
  return true;
}

void TermSession::ShowEvents() {
  bool isAnyShown = false;
  while (const std::optional<HostEvent> event = inbox_.Take()) {
    if (log_ != nullptr) {
      log_->OnEvent(*event);
    }
    if (!isAnyShown && editor_ != nullptr && (IsShown(*event) || settings_.verbosity > 0)) {
      isAnyShown = true;
      editor_->Hide();
    }
    ShowEvent(*event);
  }
  if (isAnyShown) {
    editor_->Show();
  }
  if (!logProblem_.empty()) {
    log_.reset();
    Above([this] { TellUser(std::exchange(logProblem_, "")); });
  }
}

// The only place at which bytes of a device are printed as they are.
void TermSession::ShowEvent(const HostEvent& event) {
  const auto* const token = std::get_if<TokenReceived>(&event.detail);
  bool isOutputGone = false;
  if (settings_.outputMode == OutputMode::kRaw && token != nullptr) {
    const std::string time = settings_.hasTime ? LocalTimeText(event.timeUs) + " " : "";
    isOutputGone = !WriteResult(time + token->bytes + "\n");
    for (const std::string& hint : token->isCut && !settings_.isQuiet
                                       ? HintsForCutToken(token->bytes.size(), token->lengthBytes)
                                       : std::vector<std::string>()) {
      TellUser(hint);
    }
  } else {
    printer_->OnEvent(event);
    isOutputGone = printer_->IsOutputGone();
  }
  if (isOutputGone) {
    isEnding_ = true;
    end_ = Refusal("");
  }
}

void TermSession::Above(const std::function<void()>& print) {
  if (editor_ != nullptr) {
    editor_->Hide();
  }
  print();
  if (editor_ != nullptr) {
    editor_->Show();
  }
}

void TermSession::MakePrinter() {
  using Form = PrintOptions::Form;
  PrintOptions options;
  options.form = settings_.outputMode == OutputMode::kHex    ? Form::kHex
                 : settings_.outputMode == OutputMode::kDump ? Form::kDump
                                                             : Form::kText;
  options.hasTime = settings_.hasTime;
  options.isQuiet = settings_.isQuiet;
  options.verbosity = settings_.verbosity;
  options.colour = settings_.colour;
  printer_.emplace(options);
}

// The prompt tells what a line will be.
void TermSession::SetPrompt() {
  const std::string mode =
      settings_.inputMode == InputMode::kText ? "" : std::string(" ") + NameOf(settings_.inputMode);
  editor_->SetPrompt(isNamingLog_ ? "log file> " : instance_->Port() + mode + "> ");
}

void TermSession::HandleTyped(const std::string& line) {
  if (!isNamingLog_) {
    editor_->Remember(line);
    HandleLine(line);
    return;
  }
  isNamingLog_ = false;
  if (!line.empty()) {
    BeginLog(line);
  }
  editor_->StartWith(std::exchange(setAside_, ""));
}

void TermSession::HandleLine(const std::string& line) {
  std::string bytes;
  std::string error;
  if (settings_.inputMode == InputMode::kText) {
    if (ParseTypedText(line, &bytes, &error)) {
      Send(bytes);
    } else {
      Refuse(error);
    }
  } else if (!line.empty() && settings_.inputMode == InputMode::kHex) {
    if (ParseControlText(line, &bytes, &error)) {
      Send(bytes);
    } else {
      Refuse(error);
    }
  } else if (!line.empty()) {
    RunConsole(line);
  }
  if (!isEnding_) {
    (void)Wait(Deadline::After(kBetweenLinesMs), [] { return false; });
  }
}

void TermSession::Send(const std::string& bytes) {
  Tell(Call({{"op", "send"}, {"hex", CompactHex(bytes)}}));
}

void TermSession::RunConsole(const std::string& line) {
  Answer answer = Call({{"op", "console"}, {"line", CompactHex(line)}});
  std::string reply;
  if (answer.data.contains("reply") && ParseHexBytes(answer.data.value("reply", ""), &reply)) {
    if (answer.data.value("cut", false)) {
      TellUser("the reply is cut after " + std::to_string(reply.size()) + " bytes");
    }
    if (answer.IsDone() && !reply.empty()) {
      reply = PrintableUtf8(reply);
      (void)WriteResult(reply.back() == '\n' ? reply : reply + "\n");
    } else if (reply.empty() && !answer.IsDone()) {
      answer.text = "the driver does not know this command; help lists them";
    }
  }
  Tell(answer);
}

// An instance that is gone ends the session.
Answer TermSession::Call(const nlohmann::json& request) {
  Answer answer = instance_->Call(request);
  if (answer.status == ExitStatus::kPortLost) {
    isEnding_ = true;
    end_ = std::exchange(answer, Answer());
  }
  return answer;
}

void TermSession::Tell(const Answer& answer) {
  (void)TellAnswer(answer);
  if (editor_ == nullptr && end_.IsDone()) {
    end_.status = answer.status;
  }
}

void TermSession::Refuse(const std::string& text) { Tell(Refusal(text, ExitStatus::kUsage)); }
