// SPDX-License-Identifier: Apache-2.0
// The whole system: the plug-in loaded by the reference host, tokens read through tags and
// acknowledged. The plug-in stands beside the program.
#include <condition_variable>
#include <cstdint>
#include <cstdio>
#include <mutex>
#include <string>

#include "bench/reader/ReaderReport.h"
#include "host/port/PortObserver.h"
#include "host/runtime/HostSession.h"
#include "host/runtime/TokenReader.h"

namespace {

constexpr const char* kConfiguration =
    "CfgVer=1 model=1 port=com1 baudrate=115200 parity=none bits=8 stopbits=1 mode=RS-232 "
    "rx_prefix=02 rx_suffix=03 token_queue_size=10000";

// Where the reader waits until the driver has worked off what came, as the program's commands do: a
// pause that follows bytes is news, and so is the next one, when a silence has ended their token.
class Pauses final : public PortObserver {
 public:
  void OnReceivePause(const ReceiveProgress& progress) override {
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      if (progress.receivedBytes != seenBytes_) {
        seenBytes_ = progress.receivedBytes;
        pausesToTell_ = 2;
      }
      if (pausesToTell_ == 0) {
        return;
      }
      --pausesToTell_;
      isNews_ = true;
    }
    changed_.notify_one();
  }
  void OnLineLost(const std::string& /*path*/, const std::string& /*why*/,
                  int /*errorNumber*/) override {}
  void OnLineBack(const std::string& /*path*/) override {}
  void OnPortNote(const std::string& text) override { std::fprintf(stderr, "%s\n", text.c_str()); }

  void Wait() {
    std::unique_lock<std::mutex> lock(mutex_);
    changed_.wait(lock, [this] { return isNews_; });
    isNews_ = false;
  }

 private:
  std::mutex mutex_;
  std::condition_variable changed_;
  std::uint64_t seenBytes_ = 0;
  int pausesToTell_ = 0;
  bool isNews_ = false;
};

int Fail(const std::string& text) {
  std::fprintf(stderr, "%s\n", text.c_str());
  return 5;
}

int Run(ReaderReport* report) {
  Pauses pauses;
  HostOptions options;
  options.observer = &pauses;
  std::string error;
  if (!options.ports.Add(report->Device(), &error)) {
    return Fail(error);
  }
  HostSession session(options);
  HostResult result = session.Open();
  if (result.IsDone()) {
    result = session.Configure(kConfiguration);
  }
  if (result.IsDone()) {
    result = session.Start();
  }
  if (!result.IsDone()) {
    return Fail(result.text);
  }
  TokenReader reader(&session);
  reader.SetHexMode(false);
  report->Ready();
  ReceivedToken token;
  for (;;) {
    switch (reader.Take(&token)) {
      case TokenReader::Outcome::kToken:
        if (!report->OnToken(token.bytes)) {
          return 0;
        }
        break;
      case TokenReader::Outcome::kEmpty:
        pauses.Wait();
        break;
      case TokenReader::Outcome::kFailed:
        return Fail(reader.Error());
    }
  }
}

}  // namespace

int main(int argumentCount, char** arguments) {
  ReaderReport report(argumentCount, arguments);
  return Run(&report);
}
