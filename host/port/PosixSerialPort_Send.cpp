// SPDX-License-Identifier: Apache-2.0
// Sending.
#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <limits>

#include "host/base/Nanoseconds.h"
#include "host/port/LineSettings.h"
#include "host/port/MonotonicTime.h"
#include "host/port/PosixSerialPort.h"

namespace {

constexpr int kSendBaseLimitMs = 1000;
constexpr int kSendDrainStepMs = 1;

}  // namespace

LineSettings PosixSerialPort::CurrentSettings() const {
  const std::lock_guard<std::mutex> lock(stateMutex_);
  return settings_.value_or(LineSettings{});
}

int PosixSerialPort::SendLimitMs(const SerialDevice& device, std::size_t lengthBytes) const {
  const auto length = static_cast<long long>(lengthBytes);
  const long long lineMs = LineTimeMs(CurrentSettings(), length + device.PendingBytes());
  const long long limit = kSendBaseLimitMs + 2 * (lineMs + length * options_.txDelayMs);
  return static_cast<int>(std::min<long long>(limit, std::numeric_limits<int>::max()));
}

int PosixSerialPort::Send(const unsigned char* data, int lengthBytes, int timeoutMs) {
  if (data == nullptr || lengthBytes <= 0) {
    return 0;
  }
  const CallGuard guard(&callsInside_);
  const std::string_view bytes(reinterpret_cast<const char*>(data),
                               static_cast<std::size_t>(lengthBytes));
  const std::lock_guard<std::mutex> lock(sendMutex_);
  const std::shared_ptr<SerialDevice> device = CurrentDevice();
  const int taken = device == nullptr ? 0 : SendFrame(device.get(), bytes, timeoutMs);
  CountSend(bytes.size(), static_cast<std::size_t>(taken));
  if (observer_ != nullptr) {
    observer_->OnSent(bytes, static_cast<std::size_t>(taken));
  }
  return taken;
}

void PosixSerialPort::CountSend(std::size_t lengthBytes, std::size_t takenBytes) {
  const std::lock_guard<std::mutex> lock(stateMutex_);
  ++counters_.sends;
  counters_.sentBytes += takenBytes;
  counters_.lostSends += takenBytes < lengthBytes ? 1 : 0;
  counters_.lostSendBytes += lengthBytes - takenBytes;
}

int PosixSerialPort::SendFrame(SerialDevice* device, std::string_view bytes, int timeoutMs) {
  const int limitMs = timeoutMs > 0 ? timeoutMs : SendLimitMs(*device, bytes.size());
  const Deadline deadline = Deadline::After(limitMs);
  if (options_.stripsEcho) {
    const auto length = static_cast<long long>(bytes.size());
    const long long lineMs = LineTimeMs(CurrentSettings(), length + device->PendingBytes()) +
                             length * options_.txDelayMs;
    echo_.Expect(bytes, MonotonicNs(), lineMs * kNsPerMs);
  }
  const bool needsRts = device->NeedsRts();
  if (needsRts) {
    (void)device->SetRts(true);
  }
  const int sent = options_.txDelayMs > 0 ? SendSpaced(*device, bytes, deadline)
                                          : SendAll(*device, bytes, deadline);
  if (needsRts) {
    // The receiver of a two-wire line hears nothing while RTS is on, so it goes off at once.
    if (AwaitSent(*device, deadline)) {
      device->Drain();
    }
    (void)device->SetRts(false);
  }
  if (options_.stripsEcho) {
    echo_.Withdraw(bytes.size() - static_cast<std::size_t>(sent));
  }
  return sent;
}

int PosixSerialPort::SendAll(const SerialDevice& device, std::string_view bytes,
                             const Deadline& deadline) const {
  std::size_t sent = 0;
  while (sent < bytes.size() && !isCancelled_.load()) {
    const ssize_t written =
        write(device.FileDescriptor(), bytes.data() + sent, bytes.size() - sent);
    if (written > 0) {
      sent += static_cast<std::size_t>(written);
    } else if (written < 0 && errno == EINTR) {
      continue;
    } else if (written == 0 || errno == EAGAIN) {
      std::array<pollfd, 2> waits = {
          {{device.FileDescriptor(), POLLOUT, 0}, {cancelled_.FileDescriptor(), POLLIN, 0}}};
      if (deadline.HasPassed() || deadline.Poll(waits.data(), waits.size()) <= 0 ||
          (waits[0].revents & (POLLHUP | POLLERR | POLLNVAL)) != 0) {
        break;
      }
    } else {
      break;
    }
  }
  return static_cast<int>(sent);
}

// A byte at a time; the pause begins when the byte has left.
int PosixSerialPort::SendSpaced(const SerialDevice& device, std::string_view bytes,
                                const Deadline& deadline) const {
  int sent = 0;
  for (const char& byte : bytes) {
    if (SendAll(device, {&byte, 1}, deadline) == 0) {
      break;
    }
    ++sent;
    if (&byte == &bytes.back() || !AwaitSent(device, deadline)) {
      continue;
    }
    const int byteMs = static_cast<int>(LineTimeMs(CurrentSettings(), 1));
    pollfd wait = {cancelled_.FileDescriptor(), POLLIN, 0};
    (void)Deadline::After(options_.txDelayMs + byteMs).Poll(&wait, 1);
  }
  return sent;
}

// Waits until the system's output queue is empty; false when the time is over first.
bool PosixSerialPort::AwaitSent(const SerialDevice& device, const Deadline& deadline) const {
  while (device.PendingBytes() > 0) {
    if (deadline.HasPassed() || isCancelled_.load()) {
      return false;
    }
    Deadline::After(kSendDrainStepMs).Sleep();
  }
  return true;
}
