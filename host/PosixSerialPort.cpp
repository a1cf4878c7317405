// SPDX-License-Identifier: Apache-2.0
#include "host/PosixSerialPort.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <limits>
#include <system_error>
#include <utility>

#include "interfaces/CompareInterface.h"

namespace {

constexpr int kSendBaseLimitMs = 1000;
constexpr int kLeaveStepMs = 1;

int CreateCancelDescriptor() {
  const int descriptor = eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
  if (descriptor < 0) {
    throw std::system_error(errno, std::generic_category(), "eventfd");
  }
  return descriptor;
}

}  // namespace

PosixSerialPort::PosixSerialPort(std::shared_ptr<SerialDevice> device, std::string path,
                                 PortObserver* observer)
    : path_(std::move(path)),
      observer_(observer),
      cancelDescriptor_(CreateCancelDescriptor()),
      device_(device),
      receiveDevice_(std::move(device)) {}

PosixSerialPort::~PosixSerialPort() {
  Cancel();
  while (callsInside_.load() != 0) {
    Deadline::After(kLeaveStepMs).Sleep();
  }
  (void)close(cancelDescriptor_);
}

void* PosixSerialPort::ConvertTo(const char* name) {
  const bool isOurs =
      CompareInterface(name, "PosixSerialPort") || CompareInterface(name, "ISerialPort");
  return isOurs ? this : nullptr;
}

void PosixSerialPort::Cancel() {
  isCancelled_.store(true);
  const std::uint64_t one = 1;
  (void)!write(cancelDescriptor_, &one, sizeof one);
}

std::string PosixSerialPort::LastSetupError() const {
  const std::lock_guard<std::mutex> lock(stateMutex_);
  return setupError_;
}

std::shared_ptr<SerialDevice> PosixSerialPort::CurrentDevice() const {
  const std::lock_guard<std::mutex> lock(stateMutex_);
  return device_;
}

int PosixSerialPort::Setup(int baudrate, int parity, int dataBits, int stopBits, int mode) {
  const CallGuard guard(&callsInside_);
  const LineSettings settings{baudrate, parity, dataBits, stopBits, mode};
  std::string why;
  std::string note;
  bool isDone = false;
  {
    // Held while the device is asked, so that a line that returns right now gets these settings.
    const std::lock_guard<std::mutex> lock(stateMutex_);
    if (device_ == nullptr) {
      why = WhyInvalid(settings);
      why = why.empty() ? "the line is lost" : why;
      settings_ = settings;
    } else {
      isDone = device_->Apply(settings, &why, &note);
      if (isDone) {
        settings_ = settings;
      }
    }
    setupError_ = why;
  }
  if (!note.empty() && observer_ != nullptr) {
    observer_->OnPortNote(path_ + ": " + note);
  }
  return isDone ? 1 : 0;
}

int PosixSerialPort::SendLimitMs(const SerialDevice& device, int lengthBytes) const {
  LineSettings settings;
  {
    const std::lock_guard<std::mutex> lock(stateMutex_);
    settings = settings_.value_or(LineSettings{});
  }
  const long long bytes = static_cast<long long>(lengthBytes) + device.PendingBytes();
  const long long limit = kSendBaseLimitMs + 2 * LineTimeMs(settings, bytes);
  return static_cast<int>(std::min<long long>(limit, std::numeric_limits<int>::max()));
}

int PosixSerialPort::Send(const unsigned char* data, int lengthBytes, int timeoutMs) {
  if (data == nullptr || lengthBytes <= 0) {
    return 0;
  }
  const CallGuard guard(&callsInside_);
  const std::lock_guard<std::mutex> lock(sendMutex_);
  const std::shared_ptr<SerialDevice> device = CurrentDevice();
  if (device == nullptr) {
    return 0;
  }
  const int limitMs = timeoutMs > 0 ? timeoutMs : SendLimitMs(*device, lengthBytes);
  return SendAll(*device, data, lengthBytes, Deadline::After(limitMs));
}

int PosixSerialPort::SendAll(const SerialDevice& device, const unsigned char* data, int lengthBytes,
                             const Deadline& deadline) const {
  int sent = 0;
  while (sent < lengthBytes && !isCancelled_.load()) {
    const ssize_t written =
        write(device.FileDescriptor(), data + sent, static_cast<std::size_t>(lengthBytes - sent));
    if (written > 0) {
      sent += static_cast<int>(written);
    } else if (written < 0 && errno == EINTR) {
      continue;
    } else if (written == 0 || errno == EAGAIN) {
      std::array<pollfd, 2> waits = {
          {{device.FileDescriptor(), POLLOUT, 0}, {cancelDescriptor_, POLLIN, 0}}};
      if (deadline.HasPassed() || deadline.Poll(waits.data(), waits.size()) <= 0 ||
          (waits[0].revents & (POLLHUP | POLLERR | POLLNVAL)) != 0) {
        break;
      }
    } else {
      break;
    }
  }
  return sent;
}

int PosixSerialPort::Receive(unsigned char* byte, int timeoutMs, int /*reserved*/) {
  if (byte == nullptr) {
    return 0;
  }
  if (next_ == end_) {
    const CallGuard guard(&callsInside_);
    if (observer_ != nullptr) {
      observer_->OnReceivePause(progress_);
    }
    if (!WaitAndFill(Deadline::After(std::max(timeoutMs, 1)))) {
      ++progress_.silences;
      return 0;
    }
  }
  *byte = buffer_[next_++];
  return 1;
}

bool PosixSerialPort::WaitAndFill(const Deadline& deadline) {
  // The deadline is looked at only after a read: on a busy machine the byte may be there in time
  // while this thread is not.
  while (!isCancelled_.load()) {
    if (receiveDevice_ == nullptr) {
      WaitForReturn(deadline);
    }
    if (receiveDevice_ != nullptr && ReadBlock(deadline)) {
      return true;
    }
    if (deadline.HasPassed()) {
      return false;
    }
  }
  return false;
}

// One attempt to read, then at most one wait. True when the buffer holds something.
bool PosixSerialPort::ReadBlock(const Deadline& deadline) {
  const ssize_t count = read(receiveDevice_->FileDescriptor(), buffer_.data(), buffer_.size());
  if (count > 0) {
    next_ = 0;
    end_ = static_cast<std::size_t>(count);
    progress_.receivedBytes += end_;
    return true;
  }
  if (count == 0) {
    Lose("the other end hung up");
  } else if (errno == EAGAIN) {
    if (!WaitReadable(deadline)) {
      Lose(std::generic_category().message(errno));
    }
  } else if (errno != EINTR) {
    Lose(std::generic_category().message(errno));
  }
  return false;
}

// False when waiting itself fails, with errno.
bool PosixSerialPort::WaitReadable(const Deadline& deadline) {
  std::array<pollfd, 2> waits = {
      {{receiveDevice_->FileDescriptor(), POLLIN, 0}, {cancelDescriptor_, POLLIN, 0}}};
  return deadline.Poll(waits.data(), waits.size()) >= 0;
}

void PosixSerialPort::Lose(const std::string& why) {
  receiveDevice_->MarkLost();
  {
    const std::lock_guard<std::mutex> lock(stateMutex_);
    device_.reset();
  }
  // The file must be closed soon: a plugged adapter gets its old name only when nobody holds it.
  receiveDevice_.reset();
  nextReturn_ = Deadline::After(kReturnIntervalMs);
  returnProblem_ = PortProblem::Kind::kAbsent;
  if (observer_ != nullptr) {
    observer_->OnLineLost(path_, why);
  }
}

void PosixSerialPort::WaitForReturn(const Deadline& deadline) {
  if (nextReturn_.HasPassed()) {
    nextReturn_ = Deadline::After(kReturnIntervalMs);
    if (TryReturn()) {
      return;
    }
  }
  pollfd wait = {cancelDescriptor_, POLLIN, 0};
  (void)Deadline::Earlier(deadline, nextReturn_).Poll(&wait, 1);
}

bool PosixSerialPort::TryReturn() {
  // The number of a pseudo-terminal is used again, maybe for somebody's login: never take that.
  if (IsControllingTerminal(path_)) {
    return false;
  }
  PortProblem problem;
  std::shared_ptr<SerialDevice> device = SerialDevice::Open(path_, &problem);
  if (device == nullptr) {
    if (problem.kind != returnProblem_ && observer_ != nullptr) {
      observer_->OnPortNote(path_ + ": " + problem.text);
    }
    returnProblem_ = problem.kind;
    return false;
  }
  std::string why;
  std::string note;
  {
    const std::lock_guard<std::mutex> lock(stateMutex_);
    if (settings_.has_value()) {
      (void)device->Apply(*settings_, &why, &note);
      setupError_ = why;
    }
    device_ = device;
  }
  receiveDevice_ = std::move(device);
  if (observer_ != nullptr) {
    observer_->OnLineBack(path_);
    if (!why.empty()) {
      observer_->OnPortNote(path_ + ": " + why);
    }
  }
  return true;
}
