// SPDX-License-Identifier: Apache-2.0
// The port's own thread: takes what arrives, notices the end of the line and its return.
#include <poll.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <exception>
#include <system_error>
#include <utility>

#include "host/base/Nanoseconds.h"
#include "host/base/SystemError.h"
#include "host/port/MonotonicTime.h"
#include "host/port/PortHolder.h"
#include "host/port/PosixSerialPort.h"

namespace {

constexpr std::size_t kReadBytes = 4096;
constexpr int kLookForRoomMs = 100;

}  // namespace

void PosixSerialPort::Serve() {
  while (!isCancelled_.load()) {
    if (const std::shared_ptr<SerialDevice> device = CurrentDevice()) {
      ServeLine(device);
    } else {
      WaitForReturn();
    }
  }
}

// One wait and one attempt to read.
void PosixSerialPort::ServeLine(const std::shared_ptr<SerialDevice>& device) {
  if (queue_.IsFull()) {
    WaitForRoom();
    return;
  }
  std::array<pollfd, 2> waits = {
      {{device->FileDescriptor(), POLLIN, 0}, {cancelled_.FileDescriptor(), POLLIN, 0}}};
  if (poll(waits.data(), waits.size(), -1) < 0) {
    if (errno != EINTR) {
      Lose(device, SystemErrorText(errno), errno);
    }
    return;
  }
  if (waits[0].revents == 0) {
    return;
  }
  switch (ReadLine(*device, nullptr)) {
    case Found::kBytes:
      break;
    case Found::kNothing:
      // The receiver was faster, unless the line has ended.
      if ((waits[0].revents & (POLLHUP | POLLERR | POLLNVAL)) != 0) {
        Lose(device, "the other end hung up", device->ErrorNumber());
      }
      break;
    case Found::kEnd:
      Lose(device, "the other end hung up", device->ErrorNumber());
      break;
    case Found::kError:
      Lose(device, SystemErrorText(errno), errno);
      break;
  }
}

// Nothing is read meanwhile, not even the end of the line: what was received before comes first.
void PosixSerialPort::WaitForRoom() {
  std::array<pollfd, 2> waits = {
      {{hasRoom_.FileDescriptor(), POLLIN, 0}, {cancelled_.FileDescriptor(), POLLIN, 0}}};
  (void)poll(waits.data(), waits.size(), kLookForRoomMs);
  hasRoom_.Clear();
}

PosixSerialPort::Found PosixSerialPort::ReadLine(const SerialDevice& device, const Waited* waited) {
  std::array<char, kReadBytes> buffer;  // NOLINT(cppcoreguidelines-pro-type-member-init): filled
  const std::lock_guard<std::mutex> lock(readMutex_);
  ssize_t count = 0;
  do {
    count = read(device.FileDescriptor(), buffer.data(), buffer.size());
  } while (count < 0 && errno == EINTR);
  if (count == 0) {
    return Found::kEnd;
  }
  if (count < 0) {
    return errno == EAGAIN ? Found::kNothing : Found::kError;
  }
  std::int64_t arrivedNs = MonotonicNs();
  if (waited != nullptr) {
    arrivedNs = ArrivalClock::BelatedArrivalNs(arrivedNs, waited->deadlineNs, waited->timeoutNs);
  }
  receivedBytes_.fetch_add(static_cast<std::uint64_t>(count));
  try {
    Keep(std::string(buffer.data(), static_cast<std::size_t>(count)), arrivedNs);
  } catch (const std::exception&) {
    lostBytes_.fetch_add(static_cast<std::uint64_t>(count));
  }
  return Found::kBytes;
}

void PosixSerialPort::Keep(std::string bytes, std::int64_t arrivedNs) {
  if (options_.stripsEcho) {
    StripEcho(&bytes, MonotonicNs());
  }
  queue_.Push({arrivedNs, std::move(bytes)});
}

void PosixSerialPort::StripEcho(std::string* bytes, std::int64_t nowNs) {
  std::size_t removedBytes = 0;
  const EchoFilter::Outcome outcome = echo_.Filter(bytes, nowNs, &removedBytes);
  echoBytes_.fetch_add(removedBytes);
  if (outcome == EchoFilter::Outcome::kAsExpected) {
    return;
  }
  echoMismatches_.fetch_add(1);
  Note(outcome == EchoFilter::Outcome::kMismatch
           ? "echo=strip: something else came back than was sent; two devices sent at once?"
           : "echo=strip: what was sent did not come back; does this line echo?");
}

void PosixSerialPort::Lose(const std::shared_ptr<SerialDevice>& device, const std::string& why,
                           int errorNumber) {
  // Asked for the last time, as far as a lost line still answers.
  const LineErrors errors = device->Errors();
  device->MarkLost();
  echo_.Clear();
  {
    const std::lock_guard<std::mutex> lock(stateMutex_);
    // The file must be closed soon: a plugged adapter gets its old name only when nobody holds it.
    device_.reset();
    lostSinceNs_ = MonotonicNs();
    ++counters_.losses;
    counters_.lineErrors += errors;
  }
  isLost_.store(true);
  nextReturn_ = Deadline::After(kReturnIntervalMs);
  returnProblem_ = PortProblem::Kind::kAbsent;
  if (observer_ == nullptr) {
    return;
  }
  if (options_.reconnects) {
    observer_->OnLineLost(options_.path, why, errorNumber);
  } else {
    observer_->OnLineGone(options_.path, why, errorNumber);
  }
}

void PosixSerialPort::WaitForReturn() {
  if (options_.reconnects && nextReturn_.HasPassed()) {
    nextReturn_ = Deadline::After(kReturnIntervalMs);
    if (TryReturn()) {
      return;
    }
  }
  pollfd wait = {cancelled_.FileDescriptor(), POLLIN, 0};
  (void)(options_.reconnects ? nextReturn_ : Deadline::After(kReturnIntervalMs)).Poll(&wait, 1);
}

bool PosixSerialPort::TryReturn() {
  // The number of a pseudo-terminal is used again, maybe for somebody's login: never take that.
  if (IsControllingTerminal(returnPath_)) {
    return false;
  }
  PortOptions options = options_;
  options.path = returnPath_;
  PortProblem problem;
  const std::shared_ptr<SerialDevice> device = SerialDevice::Open(options, &problem, calls_);
  if (device == nullptr) {
    if (problem.kind != returnProblem_) {
      Note(problem.text);
    }
    returnProblem_ = problem.kind;
    return false;
  }
  PutBack(device);
  return true;
}

void PosixSerialPort::PutBack(const std::shared_ptr<SerialDevice>& device) {
  std::string why;
  std::string note;
  {
    const std::lock_guard<std::mutex> lock(stateMutex_);
    if (settings_.has_value()) {
      (void)device->Apply(*settings_, &why, &note);
      setupError_ = why;
    }
    device_ = device;
    ++counters_.reconnects;
    counters_.lostMs += static_cast<std::uint64_t>((MonotonicNs() - lostSinceNs_) / kNsPerMs);
  }
  isLost_.store(false);
  if (observer_ != nullptr) {
    observer_->OnLineBack(options_.path);
  }
  if (!why.empty()) {
    Note(why);
  }
}
