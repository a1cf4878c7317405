// SPDX-License-Identifier: Apache-2.0
#include "host/text/BackgroundLines.h"

#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <utility>

#include "host/base/Deadline.h"

namespace {

constexpr int kNoReaderLimitMs = INT_MAX;
constexpr int kLastWordsMs = 200;
// A pipe that is ready takes at least so many bytes at once (pipe(7)).
constexpr std::size_t kLinePieceBytes = PIPE_BUF;

}  // namespace

BackgroundLines::BackgroundLines(int fileDescriptor)
    : fileDescriptor_(fileDescriptor), thread_([this] { Run(); }) {}

BackgroundLines::~BackgroundLines() {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    isEnding_ = true;
  }
  ending_.Raise();
  wake_.Raise();
  thread_.join();
}

void BackgroundLines::Write(const std::string& line) {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (waiting_.size() + line.size() >= kMaxWaitingBytes) {
    ++leftOut_;
    return;
  }
  if (leftOut_ > 0) {
    waiting_ += "loka: " + std::to_string(leftOut_) + " lines were not read in time\n";
    leftOut_ = 0;
  }
  waiting_ += line + "\n";
  wake_.Raise();
}

std::string BackgroundLines::Take() {
  const std::lock_guard<std::mutex> lock(mutex_);
  return std::exchange(waiting_, {});
}

bool BackgroundLines::IsEnding() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return isEnding_;
}

void BackgroundLines::Run() {
  bool isLast = false;
  while (!isLast) {
    pollfd wait = {wake_.FileDescriptor(), POLLIN, 0};
    (void)Deadline::After(kNoReaderLimitMs).Poll(&wait, 1);
    wake_.Clear();
    isLast = IsEnding();
    Put(Take());
  }
}

// False when nobody reads any more; only the end makes that matter.
bool BackgroundLines::AwaitReader() const {
  for (;;) {
    const bool isEnding = IsEnding();
    std::array<pollfd, 2> waits = {
        {{fileDescriptor_, POLLOUT, 0}, {ending_.FileDescriptor(), POLLIN, 0}}};
    (void)Deadline::After(isEnding ? kLastWordsMs : kNoReaderLimitMs)
        .Poll(waits.data(), isEnding ? 1 : 2);
    if (waits[0].revents != 0 || isEnding) {
      return waits[0].revents != 0;
    }
  }
}

void BackgroundLines::Put(const std::string& bytes) const {
  std::size_t written = 0;
  while (written < bytes.size() && AwaitReader()) {
    const std::size_t piece = std::min(bytes.size() - written, kLinePieceBytes);
    const ssize_t count = write(fileDescriptor_, bytes.data() + written, piece);
    if (count < 0 && errno != EINTR && errno != EAGAIN) {
      return;
    }
    written += count > 0 ? static_cast<std::size_t>(count) : 0;
  }
}
