// SPDX-License-Identifier: Apache-2.0
#include "host/commands/SendCommand.h"

#include <CLI/CLI.hpp>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>

#include "host/commands/EventPrinter.h"
#include "host/framing/ControlNames.h"
#include "host/text/ByteText.h"
#include "host/text/Output.h"

namespace {

constexpr std::size_t kMaxPayloadBytes = std::size_t{256} * 1024;

constexpr int kSentLimitMs = 2000;  // an empty token without prefix and suffix is never told of

Answer SendBytes(Instance* instance, const std::string& bytes) {
  return instance->Call({{"op", "send"}, {"hex", CompactHex(bytes)}});
}

// Shows what goes out, and what else happens meanwhile; tokens stay with those who read them.
class SentPrinter final : public EventSink {
 public:
  explicit SentPrinter(const PrintOptions& options) : printer_(options) {}

  void OnEvent(const HostEvent& event) override {
    isSent_ = isSent_ || std::holds_alternative<BytesSent>(event.detail);
    if (!std::holds_alternative<TokenReceived>(event.detail)) {
      printer_.OnEvent(event);
    }
  }

  void Forget() { isSent_ = false; }
  bool IsSent() const { return isSent_; }

 private:
  EventPrinter printer_;
  bool isSent_ = false;
};

// Sends, and with -v shows the bytes as they go out.
class Sender {
 public:
  Sender(Instance* instance, const InstanceAccess& access)
      : instance_(instance), isShown_(access.verbosity > 0), printer_(PrintOptionsOf(access)) {}

  Answer Send(const std::string& bytes) {
    Answer answer = isShown_ ? instance_->Subscribe() : Answer();
    if (answer.IsDone()) {
      answer = SendBytes(instance_, bytes);
    }
    if (answer.IsDone() && isShown_) {
      printer_.Forget();
      const Answer shown = instance_->Serve(
          &printer_, [this] { return printer_.IsSent(); }, Deadline::After(kSentLimitMs));
      return shown.status == ExitStatus::kTimeout ? answer : shown;
    }
    return answer;
  }

 private:
  static PrintOptions PrintOptionsOf(const InstanceAccess& access) {
    PrintOptions print;
    print.verbosity = access.verbosity;
    print.colour = access.colour;
    return print;
  }

  Instance* const instance_;
  const bool isShown_;
  SentPrinter printer_;
};

bool ReadAll(std::istream* stream, std::string* bytes, std::string* error) {
  bytes->assign(std::istreambuf_iterator<char>(*stream), std::istreambuf_iterator<char>());
  if (bytes->size() > kMaxPayloadBytes) {
    *error = "more than " + std::to_string(kMaxPayloadBytes) + " bytes are no token";
    return false;
  }
  return true;
}

bool ReadFile(const std::string& path, std::string* bytes, std::string* error) {
  if (path == "-") {
    return ReadAll(&std::cin, bytes, error);
  }
  std::ifstream stream(path, std::ios::binary);
  if (!stream || std::filesystem::is_directory(path)) {
    *error = path + " cannot be read";
    return false;
  }
  return ReadAll(&stream, bytes, error);
}

// Every line of standard input as a token of its own, without its line end (LF or CR LF).
Answer SendLines(const Instance& instance, Sender* sender) {
  std::string line;
  while (instance.StopSignal() == 0 && std::getline(std::cin, line)) {
    if (!line.empty() && line.back() == '\r') {
      line.pop_back();
    }
    Answer answer = sender->Send(line);
    if (!answer.IsDone()) {
      return answer;
    }
  }
  return {};
}

}  // namespace

void PayloadFlags::Add(CLI::App* command, bool withFile) {
  CLI::Option_group* const group = command->add_option_group("What to send");
  group->add_option("-m,--message", text, "Text")->type_name("TEXT");
  group->add_option("-x,--hex-message", hexText, "Bytes: 02 41, STX 41 CR LF")->type_name("HEX");
  if (withFile) {
    group->add_option("-f,--file", file, "Content of a file; - is standard input")
        ->type_name("FILE");
  }
}

bool PayloadFlags::Bytes(std::string* bytes, std::string* error) const {
  if (!file.empty()) {
    return ReadFile(file, bytes, error);
  }
  if (!hexText.empty()) {
    return ParseControlText(hexText, bytes, error);
  }
  *bytes = text;
  return true;
}

void AddSend(CLI::App* app, SendOptions* options) {
  CLI::App* const send = app->add_subcommand("send", "Send one token, or one a line");
  options->payload.Add(send, true);
  CLI::App* const group = send->get_option_group("What to send");
  group->add_flag("-l,--lines", options->isByLine, "Each line of standard input");
  group->require_option(1);
  AddInstanceAccess(send, &options->access);
  send->footer("Example: loka send /dev/ttyUSB0 -b 9600 -p none --tx-suffix CRLF -m R");
}

int RunSend(SendOptions* options) {
  std::string bytes;
  std::string error;
  if (!options->isByLine && !options->payload.Bytes(&bytes, &error)) {
    TellUser(error);
    return static_cast<int>(ExitStatus::kUsage);
  }
  options->access.acknowledges = false;
  Answer answer;
  const auto instance = OpenInstance(&options->access, &answer);
  if (instance == nullptr) {
    return TellAnswer(answer);
  }
  Sender sender(instance.get(), options->access);
  answer = options->isByLine ? SendLines(*instance, &sender) : sender.Send(bytes);
  return EndOf(*instance, answer);
}

void AddAsk(CLI::App* app, AskOptions* options) {
  CLI::App* const ask = app->add_subcommand("ask", "Send a token, print the next one");
  options->payload.Add(ask, false);
  ask->get_option_group("What to send")->require_option(1);
  ask->add_option("-W,--wait", options->limitSeconds, "Seconds to wait; exit status 27")
      ->type_name("S")
      ->check(CLI::Range(0.001, 2000000.0).description(""))
      ->capture_default_str();
  ask->add_flag("--fresh", options->isFresh, "Drop first what is waiting");
  CLI::Option* const json = ask->add_flag("-j,--json", options->isJson, "Answer as JSON");
  ask->add_flag("-X,--hex-output", options->isHex, "Answer as hexadecimal")->excludes(json);
  AddInstanceAccess(ask, &options->access);
  ask->footer("Example: loka ask /dev/ttyUSB0 -b 9600 -p none --rx-suffix CRLF -m R -W 2 --fresh");
}

int RunAsk(AskOptions* options) {
  std::string bytes;
  std::string error;
  if (!options->payload.Bytes(&bytes, &error)) {
    TellUser(error);
    return static_cast<int>(ExitStatus::kUsage);
  }
  Answer answer;
  const auto instance = OpenInstance(&options->access, &answer);
  if (instance == nullptr) {
    return TellAnswer(answer);
  }
  if (options->isFresh) {
    answer = instance->Call({{"op", "ack"}, {"all", true}});
  }
  if (answer.IsDone()) {
    answer = instance->Subscribe();
  }
  if (answer.IsDone()) {
    answer = SendBytes(instance.get(), bytes);
  }
  if (!answer.IsDone()) {
    return EndOf(*instance, answer);
  }
  PrintOptions print;
  print.isQuiet = options->access.isQuiet;
  print.verbosity = options->access.verbosity;
  print.colour = options->access.colour;
  print.form = options->isJson  ? PrintOptions::Form::kJson
               : options->isHex ? PrintOptions::Form::kHex
                                : PrintOptions::Form::kText;
  EventPrinter printer(print);
  const auto isDone = [&] { return printer.TokenCount() > 0; };
  answer = instance->Serve(&printer, isDone,
                           Deadline::After(static_cast<int>(options->limitSeconds * 1000)));
  if (answer.status == ExitStatus::kTimeout) {
    answer.text = "no answer within the time of -W";
  }
  return EndOf(*instance, answer);
}
