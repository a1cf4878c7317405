// SPDX-License-Identifier: Apache-2.0
#include "host/term/KeyInput.h"

#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <utility>

namespace {

constexpr std::size_t kReadBytes = 4096;
// Beyond it the rest stays in the pipe.
constexpr std::size_t kMaxKeptBytes = KeyInput::kMaxLineBytes + kReadBytes;

}  // namespace

KeyInput::KeyInput(int fileDescriptor, std::function<void()> onInput)
    : fileDescriptor_(fileDescriptor), onInput_(std::move(onInput)), thread_([this] { Run(); }) {}

KeyInput::~KeyInput() {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    isEnding_ = true;
  }
  hasRoom_.notify_all();
  end_.Raise();
  thread_.join();
}

// False at the end of the input and of the object.
bool KeyInput::Read(std::string* bytes) const {
  for (;;) {
    std::array<pollfd, 2> waits = {
        {{fileDescriptor_, POLLIN, 0}, {end_.FileDescriptor(), POLLIN, 0}}};
    if (poll(waits.data(), waits.size(), -1) < 0 && errno != EINTR) {
      return false;
    }
    if ((waits[1].revents & POLLIN) != 0) {
      return false;
    }
    if (waits[0].revents == 0) {
      continue;
    }
    std::array<char, kReadBytes> buffer{};
    const ssize_t count = read(fileDescriptor_, buffer.data(), buffer.size());
    if (count < 0 && (errno == EINTR || errno == EAGAIN)) {
      continue;
    }
    if (count <= 0) {
      return false;
    }
    bytes->assign(buffer.data(), static_cast<std::size_t>(count));
    return true;
  }
}

void KeyInput::Run() {
  std::string bytes;
  while (Read(&bytes)) {
    {
      std::unique_lock<std::mutex> lock(mutex_);
      hasRoom_.wait(lock, [this] { return isEnding_ || bytes_.size() - next_ < kMaxKeptBytes; });
      if (isEnding_) {
        return;
      }
      bytes_.erase(0, next_);
      searched_ -= std::min(searched_, next_);
      next_ = 0;
      bytes_ += bytes;
    }
    onInput_();
  }
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    isOver_ = true;
  }
  onInput_();
}

// With the mutex held. Looks at each byte once.
std::size_t KeyInput::FindLineEnd() const {
  const std::size_t end = bytes_.find('\n', std::max(searched_, next_));
  searched_ = end == std::string::npos ? bytes_.size() : end;
  return end;
}

bool KeyInput::HasByte() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return isOver_ || next_ < bytes_.size();
}

bool KeyInput::HasLine() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return isOver_ || bytes_.size() - next_ >= kMaxLineBytes || FindLineEnd() != std::string::npos;
}

bool KeyInput::IsAtEnd() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return isOver_ && next_ == bytes_.size();
}

bool KeyInput::TakeByte(char* byte) {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (next_ == bytes_.size()) {
    return false;
  }
  *byte = bytes_[next_++];
  hasRoom_.notify_all();
  return true;
}

bool KeyInput::TakeLine(std::string* line) {
  const std::lock_guard<std::mutex> lock(mutex_);
  const std::size_t end = FindLineEnd();
  if (end != std::string::npos) {
    line->assign(bytes_, next_, end - next_);
    next_ = end + 1;
    if (!line->empty() && line->back() == '\r') {
      line->pop_back();
    }
  } else if ((isOver_ && next_ < bytes_.size()) || bytes_.size() - next_ >= kMaxLineBytes) {
    line->assign(bytes_, next_, std::string::npos);
    next_ = bytes_.size();
  } else {
    return false;
  }
  hasRoom_.notify_all();
  return true;
}
