// SPDX-License-Identifier: Apache-2.0
#include <spdlog/details/log_msg.h>
#include <spdlog/pattern_formatter.h>
#include <spdlog/sinks/rotating_file_sink.h>

#include <atomic>
#include <cstddef>
#include <exception>
#include <utility>

#include "host/events/EventText.h"
#include "host/events/WallClock.h"
#include "host/log/LogFile.h"

namespace {

constexpr std::size_t kMaxFileBytes = std::size_t{10} * 1024 * 1024;
constexpr std::size_t kKeptFiles = 5;

class SpdlogFile final : public LogFile {
 public:
  // Throws spdlog's exception when the file cannot be opened.
  SpdlogFile(const std::string& path, ProblemHandler onProblem)
      : sink_(path, kMaxFileBytes, kKeptFiles), onProblem_(std::move(onProblem)) {
    // The line is made here, since it has the time of the event.
    sink_.set_formatter(std::make_unique<spdlog::pattern_formatter>("%v"));
  }

  void OnEvent(const HostEvent& event) override {
    // The roles of bytes that stand in the log already.
    if (std::holds_alternative<BytesLabelled>(event.detail)) {
      return;
    }
    const std::string line = UtcText(event.timeUs) + " " + event.port + " " + EventText(event);
    try {
      sink_.log(spdlog::details::log_msg("", spdlog::level::info, line));
      sink_.flush();
    } catch (const std::exception& error) {
      if (!hasFailed_.exchange(true)) {
        onProblem_(std::string("the log is not complete: ") + error.what());
      }
    }
  }

 private:
  spdlog::sinks::rotating_file_sink_mt sink_;
  const ProblemHandler onProblem_;
  std::atomic<bool> hasFailed_{false};
};

}  // namespace

bool LogFile::IsBuiltIn() { return true; }

std::unique_ptr<LogFile> LogFile::Open(const std::string& path, ProblemHandler onProblem,
                                       std::string* error) {
  try {
    return std::make_unique<SpdlogFile>(path, std::move(onProblem));
  } catch (const std::exception& failure) {
    *error = "log file: " + std::string(failure.what());
    return nullptr;
  }
}
