// SPDX-License-Identifier: Apache-2.0
#include "host/WatchCommand.h"

#include <sys/time.h>

#include <array>
#include <cstdio>
#include <ctime>

#include "host/ByteText.h"
#include "host/Deadline.h"
#include "host/ExitStatus.h"
#include "host/HostEvents.h"
#include "host/HostSession.h"
#include "host/Output.h"
#include "host/SignalWatch.h"
#include "host/TokenReader.h"

namespace {

constexpr int kServeRoundMs = 60 * 60 * 1000;

int Code(ExitStatus status) { return static_cast<int>(status); }

// Time of day with microseconds, in local time.
std::string TimeText() {
  timeval now{};
  (void)gettimeofday(&now, nullptr);
  tm local{};
  (void)localtime_r(&now.tv_sec, &local);
  std::array<char, 32> text{};
  (void)std::snprintf(text.data(), text.size(), "%02d:%02d:%02d.%06ld", local.tm_hour, local.tm_min,
                      local.tm_sec, static_cast<long>(now.tv_usec));
  return text.data();
}

void PrintToken(const ReceivedToken& token) {
  const char* const cutMark = token.isCut ? "..." : "";
  const std::string hex = HexBytes(token.bytes) + (token.isCut ? " 00 ..." : "");
  (void)std::printf("%s  %4u  \"%s\"%s  %s\n", TimeText().c_str(), token.lengthBytes,
                    EscapeBytes(token.bytes).c_str(), cutMark, hex.c_str());
}

class Watch {
 public:
  explicit Watch(const InstanceOptions& options)
      : options_(options),
        events_(TellUser),
        signals_([this](int signalNumber) { events_.RequestStop(signalNumber); }) {}

  int Run();

 private:
  int Serve(HostSession* session);
  bool Connect(HostSession* session, HostResult* result);
  bool PrintWaiting(TokenReader* reader, bool* isFailed);

  const InstanceOptions& options_;
  HostEvents events_;
  SignalWatch signals_;
};

int Watch::Run() {
  HostOptions host;
  std::string error;
  if (!MakeHostOptions(options_, &host, &error)) {
    TellUser(error);
    return Code(ExitStatus::kUsage);
  }
  host.observer = &events_;
  HostSession session(host);
  HostResult result = session.Open();
  if (result.IsDone()) {
    if (options_.isVerbose) {
      TellFiles(session, host);
    }
    result = session.Configure(options_.configuration);
  }
  if (result.IsDone()) {
    result = session.Start();
  }
  if (!result.IsDone() || !Connect(&session, &result)) {
    return TellFailure(options_, result);
  }
  TellSettings(options_, host, &session);
  return Serve(&session);
}

// A configuration may leave the port closed at the start; a watch wants it open.
bool Watch::Connect(HostSession* session, HostResult* result) {
  const auto tag = session->CreateTag("0?connect?boolean", &result->text);
  unsigned int isConnected = 0;
  if (tag != nullptr && tag->ReadNumber(&isConnected) &&
      (isConnected != 0 || tag->WriteNumber(1))) {
    return true;
  }
  result->status = ExitStatus::kPort;
  result->text = tag == nullptr ? result->text : tag->Error();
  result->problem = session->LastPortProblem();
  return false;
}

// Prints and acknowledges what waits. False once the driver refuses.
bool Watch::PrintWaiting(TokenReader* reader, bool* isFailed) {
  ReceivedToken token;
  // A device that never pauses must not keep a signal waiting.
  while (events_.StopSignal() == 0) {
    const TokenReader::Outcome outcome = reader->Peek(&token);
    if (outcome != TokenReader::Outcome::kToken) {
      *isFailed = outcome == TokenReader::Outcome::kFailed;
      return !*isFailed;
    }
    PrintToken(token);
    if (token.isCut) {
      TellUser("this token has " + std::to_string(token.lengthBytes) +
               " bytes and a zero byte behind the first " + std::to_string(token.bytes.size()) +
               "; the driver shows plain tokens up to there (hex_tokens=true shows all)");
    }
    if (!reader->Acknowledge()) {
      *isFailed = true;
      return false;
    }
  }
  return true;
}

int Watch::Serve(HostSession* session) {
  TokenReader reader(session);
  bool isFailed = false;
  const auto hasFailed = [&] { return !PrintWaiting(&reader, &isFailed); };
  while (!isFailed && events_.StopSignal() == 0) {
    (void)events_.WaitUntil(hasFailed, Deadline::After(kServeRoundMs));
  }
  if (isFailed) {
    TellUser(reader.Error());
    return Code(ExitStatus::kRefused);
  }
  return Code(ExitStatus::kFirstSignal) + events_.StopSignal();
}

}  // namespace

int RunWatch(const InstanceOptions& options) {
  // A line at a time, so that pipes get each token as it comes.
  (void)std::setvbuf(stdout, nullptr, _IOLBF, BUFSIZ);
  Watch watch(options);
  return watch.Run();
}
