// SPDX-License-Identifier: Apache-2.0
#include "host/WatchCommand.h"

#include <sys/time.h>

#include <array>
#include <cstdio>
#include <ctime>

#include "host/ByteText.h"
#include "host/ConfigText.h"
#include "host/Deadline.h"
#include "host/ExitStatus.h"
#include "host/HostEvents.h"
#include "host/HostSession.h"
#include "host/PortAdvice.h"
#include "host/SettingsReport.h"
#include "host/SignalWatch.h"
#include "host/StorePath.h"
#include "host/TokenReader.h"

namespace {

constexpr int kServeRoundMs = 60 * 60 * 1000;

// One call a line, so that lines of several threads do not mix.
void Tell(const std::string& text) { (void)std::fprintf(stderr, "loka: %s\n", text.c_str()); }

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
  explicit Watch(const WatchOptions& options)
      : options_(options),
        portName_(ConfigValue(options.configuration, "port", "")),
        events_(Tell),
        signals_([this](int signalNumber) { events_.RequestStop(signalNumber); }) {}

  int Run();

 private:
  bool MakeHostOptions(HostOptions* host);
  int Report(const HostResult& result) const;
  int Serve(HostSession* session);
  bool Connect(HostSession* session, HostResult* result);
  void TellSettings(HostSession* session);
  bool PrintWaiting(TokenReader* reader, bool* isFailed);

  const WatchOptions& options_;
  const std::string portName_;
  PortMap ports_;
  HostEvents events_;
  SignalWatch signals_;
};

bool Watch::MakeHostOptions(HostOptions* host) {
  for (const std::string& word : options_.portWords) {
    std::string error;
    if (!ports_.Add(word, &error)) {
      Tell("--port " + word + ": " + error);
      return false;
    }
  }
  host->pluginFile = options_.pluginFile;
  host->ports = ports_;
  if (!options_.withoutStore) {
    host->storeFile = options_.storeFile.empty() ? DefaultStorePath() : options_.storeFile;
    if (host->storeFile.empty()) {
      Tell("no home folder for the store; name one with --store FILE or use --no-store");
      return false;
    }
  }
  host->ident = options_.ident.empty() ? portName_ : options_.ident;
  host->observer = &events_;
  return true;
}

int Watch::Run() {
  HostOptions host;
  if (!MakeHostOptions(&host)) {
    return Code(ExitStatus::kUsage);
  }
  HostSession session(host);
  HostResult result = session.Open();
  if (result.IsDone()) {
    if (options_.isVerbose) {
      Tell("plug-in " + session.PluginPath());
      Tell("store " + (host.storeFile.empty() ? "none" : host.storeFile) + ", identifier " +
           host.ident);
    }
    result = session.Configure(options_.configuration);
  }
  if (result.IsDone()) {
    result = session.Start();
  }
  if (!result.IsDone() || !Connect(&session, &result)) {
    return Report(result);
  }
  TellSettings(&session);
  return Serve(&session);
}

int Watch::Report(const HostResult& result) const {
  Tell(result.text);
  if (result.status == ExitStatus::kPort) {
    for (const std::string& line : AdviceFor(result.problem)) {
      Tell(line);
    }
  } else if (result.status == ExitStatus::kConfiguration) {
    Tell("the driver rejects the configuration: " + EscapeBytes(options_.configuration));
  } else if (result.status == ExitStatus::kRefused && !options_.withoutStore) {
    Tell("--no-store goes on without stored settings");
  }
  return Code(result.status);
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

void Watch::TellSettings(HostSession* session) {
  for (const std::string& line : DescribeSettings(session, portName_, ports_.PathFor(portName_))) {
    Tell(line);
  }
  if (session->Storage() != nullptr) {
    const SqliteFile::Values stored = session->Storage()->All(session->Ident());
    for (const std::string& line : DescribeOverrides(options_.configuration, stored)) {
      Tell(line);
    }
  }
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
      Tell("this token has " + std::to_string(token.lengthBytes) +
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
    Tell(reader.Error());
    return Code(ExitStatus::kRefused);
  }
  return Code(ExitStatus::kFirstSignal) + events_.StopSignal();
}

}  // namespace

int RunWatch(const WatchOptions& options) {
  // A line at a time, so that pipes get each token as it comes.
  (void)std::setvbuf(stdout, nullptr, _IOLBF, BUFSIZ);
  Watch watch(options);
  return watch.Run();
}
