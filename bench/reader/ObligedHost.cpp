// SPDX-License-Identifier: Apache-2.0
#include "bench/reader/ObligedHost.h"

#include <poll.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <mutex>
#include <utility>

namespace {

class PlainPort final : public ISerialPort {
 public:
  PlainPort(int line, std::function<void()> onPause) : line_(line), onPause_(std::move(onPause)) {}

  void* ConvertTo(const char* /*name*/) override { return nullptr; }
  void reserved3() override {}
  void reserved4() override {}
  int Setup(int /*baudrate*/, int /*parity*/, int /*dataBits*/, int /*stopBits*/,
            int /*mode*/) override {
    return 1;
  }
  int Send(const unsigned char* /*data*/, int /*lengthBytes*/, int /*timeoutMs*/) override {
    return 0;
  }

  int Receive(unsigned char* byte, int timeoutMs, int /*reserved*/) override {
    if (next_ == end_ && !Fill(timeoutMs)) {
      return 0;
    }
    *byte = buffer_[next_++];
    return 1;
  }

 private:
  bool Fill(int timeoutMs) {
    onPause_();
    pollfd wait = {line_, POLLIN, 0};
    if (poll(&wait, 1, timeoutMs) <= 0) {
      return false;
    }
    const ssize_t count = read(line_, buffer_.data(), buffer_.size());
    if (count == 0 || (count < 0 && errno != EAGAIN && errno != EINTR)) {
      // Asking a line that has ended again and again would keep a processor busy for good.
      std::perror("the line has ended");
      std::_Exit(5);
    }
    next_ = 0;
    end_ = count > 0 ? static_cast<std::size_t>(count) : 0;
    return end_ != 0;
  }

  const int line_;
  const std::function<void()> onPause_;
  std::array<unsigned char, 4096> buffer_{};
  std::size_t next_ = 0;
  std::size_t end_ = 0;
};

class MutexSemaphore final : public ISemaphore {
 public:
  void* ConvertTo(const char* /*name*/) override { return nullptr; }
  int Lock() override {
    mutex_.lock();
    return 1;
  }
  int Unlock() override {
    mutex_.unlock();
    return 1;
  }

 private:
  std::mutex mutex_;
};

}  // namespace

std::unique_ptr<ISerialPort> MakePlainPort(int line, std::function<void()> onPause) {
  return std::make_unique<PlainPort>(line, std::move(onPause));
}

std::unique_ptr<ISemaphore> MakeMutexSemaphore() { return std::make_unique<MutexSemaphore>(); }
