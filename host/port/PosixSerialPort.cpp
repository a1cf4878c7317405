// SPDX-License-Identifier: Apache-2.0
#include "host/port/PosixSerialPort.h"

#include <algorithm>
#include <utility>

#include "host/base/Nanoseconds.h"
#include "host/port/MonotonicTime.h"
#include "host/port/PortList.h"
#include "interfaces/CompareInterface.h"

namespace {

constexpr int kLeaveStepMs = 1;

// The by-id name where the device has one; the path as it was given where it has none.
std::string ReturnPathFor(const std::string& path) {
  const std::string stableName = StableNameOf(path);
  return stableName.empty() ? path : stableName;
}

}  // namespace

PosixSerialPort::PosixSerialPort(std::shared_ptr<SerialDevice> device, PortOptions options,
                                 PortObserver* observer, const TerminalCalls& calls)
    : options_(std::move(options)),
      returnPath_(ReturnPathFor(options_.path)),
      observer_(observer),
      calls_(calls),
      device_(std::move(device)) {
  for (const std::string& note : device_->OpeningNotes()) {
    Note(note);
  }
  thread_ = std::thread([this] { Serve(); });
}

PosixSerialPort::~PosixSerialPort() {
  Cancel();
  while (callsInside_.load() != 0) {
    Deadline::After(kLeaveStepMs).Sleep();
  }
  thread_.join();
  ReportServed();
}

void* PosixSerialPort::ConvertTo(const char* name) {
  const bool isOurs =
      CompareInterface(name, "PosixSerialPort") || CompareInterface(name, "ISerialPort");
  return isOurs ? this : nullptr;
}

void PosixSerialPort::Cancel() {
  isCancelled_.store(true);
  cancelled_.Raise();
  queue_.Wake();
}

std::string PosixSerialPort::LastSetupError() const {
  const std::lock_guard<std::mutex> lock(stateMutex_);
  return setupError_;
}

std::shared_ptr<SerialDevice> PosixSerialPort::CurrentDevice() const {
  const std::lock_guard<std::mutex> lock(stateMutex_);
  return device_;
}

void PosixSerialPort::Note(const std::string& text) const {
  if (observer_ != nullptr) {
    observer_->OnPortNote(options_.path + ": " + text);
  }
}

PortCounters PosixSerialPort::Counters() const {
  PortCounters counters;
  std::shared_ptr<SerialDevice> device;
  {
    const std::lock_guard<std::mutex> lock(stateMutex_);
    counters = counters_;
    device = device_;
    if (device == nullptr) {
      const std::int64_t lostNs = MonotonicNs() - lostSinceNs_;
      counters.lostMs += static_cast<std::uint64_t>(lostNs / kNsPerMs);
    }
  }
  if (device != nullptr) {
    counters.lineErrors += device->Errors();
  }
  counters.receivedBytes = receivedBytes_.load();
  counters.servedBytes = servedBytes_.load();
  counters.lostBytes = lostBytes_.load();
  counters.echoBytes = echoBytes_.load();
  counters.echoMismatches = echoMismatches_.load();
  return counters;
}

ModemLines PosixSerialPort::Lines() const {
  const std::shared_ptr<SerialDevice> device = CurrentDevice();
  return device == nullptr ? ModemLines() : device->Lines();
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
      if (why.empty()) {
        settings_ = settings;
        why = "the line is lost";
      }
    } else {
      isDone = device_->Apply(settings, &why, &note);
      if (isDone) {
        settings_ = settings;
      }
    }
    setupError_ = why;
  }
  if (!note.empty()) {
    Note(note);
  }
  return isDone ? 1 : 0;
}

int PosixSerialPort::Receive(unsigned char* byte, int timeoutMs, int /*reserved*/) {
  if (byte == nullptr) {
    return 0;
  }
  if (next_ == block_.bytes.size()) {
    return ReceiveFromNextBlock(byte, timeoutMs);
  }
  *byte = static_cast<unsigned char>(block_.bytes[next_++]);
  return 1;
}

int PosixSerialPort::ReceiveFromNextBlock(unsigned char* byte, int timeoutMs) {
  const CallGuard guard(&callsInside_);
  ReportServed();
  if (observer_ != nullptr) {
    observer_->OnReceivePause(progress_);
  }
  if (!AwaitBlock(std::max(timeoutMs, 1) * kNsPerMs)) {
    return AnswerSilence(timeoutMs);
  }
  *byte = static_cast<unsigned char>(block_.bytes[next_++]);
  return 1;
}

int PosixSerialPort::AnswerSilence(int timeoutMs) {
  ++progress_.silences;
  if (observer_ != nullptr) {
    observer_->OnSilence(std::max(timeoutMs, 1));
  }
  return 0;
}

// False when "time-out" is the answer.
bool PosixSerialPort::AwaitBlock(std::int64_t timeoutNs) {
  const std::int64_t callNs = MonotonicNs();
  bool hasLooked = false;
  while (!isCancelled_.load()) {
    bool isLate = false;
    if (TakeBlock(timeoutNs, &isLate)) {
      return true;
    }
    std::int64_t deadlineNs = clock_.DeadlineNs(callNs, timeoutNs);
    if (isLost_.load()) {
      // Nobody can know what the line does now, and a caller in a loop must not spin.
      deadlineNs = std::max(deadlineNs, callNs + timeoutNs);
    }
    if (isLate || hasLooked) {
      clock_.TimedOut(deadlineNs);
      return false;
    }
    if (MonotonicNs() < deadlineNs) {
      (void)queue_.WaitUntil(deadlineNs);
      continue;
    }
    // The port's own thread may be kept from its work by others; only the line itself can tell.
    LookAtLine({deadlineNs, timeoutNs});
    hasLooked = !isLost_.load() || MonotonicNs() >= callNs + timeoutNs;
  }
  return false;
}

// True with the next block in place. Otherwise there is none, or it came too late to be given now.
bool PosixSerialPort::TakeBlock(std::int64_t timeoutNs, bool* isLate) {
  std::int64_t arrivedNs = 0;
  if (!queue_.Peek(&arrivedNs)) {
    return false;
  }
  if (!clock_.IsInTime(arrivedNs, timeoutNs)) {
    *isLate = true;
    return false;
  }
  bool hasRoomAgain = false;
  (void)queue_.Take(&block_, &hasRoomAgain);
  if (hasRoomAgain) {
    hasRoom_.Raise();
  }
  next_ = 0;
  clock_.Gave(arrivedNs);
  progress_.receivedBytes += block_.bytes.size();
  servedBytes_.fetch_add(block_.bytes.size());
  return true;
}

void PosixSerialPort::LookAtLine(const Waited& waited) {
  const std::shared_ptr<SerialDevice> device = CurrentDevice();
  if (device != nullptr && !queue_.IsFull()) {
    // An end or an error is left to the port's own thread, which sees it as well.
    (void)ReadLine(*device, &waited);
  }
}

void PosixSerialPort::ReportServed() {
  if (next_ == 0) {
    return;
  }
  if (observer_ != nullptr) {
    observer_->OnServed(std::string_view(block_.bytes).substr(0, next_), block_.arrivedNs,
                        block_.arrivedNs);
  }
  block_ = ArrivedBlock{};
  next_ = 0;
}
