// SPDX-License-Identifier: Apache-2.0
#include "host/framing/ReplayHost.h"

#include "interfaces/CompareInterface.h"
#include "interfaces/ITaskRunner.h"

namespace {

// Behind the end of the script the line is silent for ever.
constexpr std::size_t kAsLongAsTheGap = 0;

}  // namespace

void* ReplayPort::ConvertTo(const char* name) {
  return CompareInterface(name, "ISerialPort") ? this : nullptr;
}

int ReplayPort::Setup(int /*baudrate*/, int /*parity*/, int /*dataBits*/, int /*stopBits*/,
                      int /*mode*/) {
  return 1;
}

int ReplayPort::Send(const unsigned char* /*data*/, int lengthBytes, int /*timeoutMs*/) {
  return lengthBytes;
}

int ReplayPort::Receive(unsigned char* byte, int timeoutMs, int /*reserved*/) {
  std::size_t leftMs = timeoutMs > 0 ? static_cast<std::size_t>(timeoutMs) : 1;
  while (event_ < script_->size()) {
    const LineEvent& event = (*script_)[event_];
    if (position_ < event.bytes.size()) {
      ++bytesPlayed_;
      if (beforeByte_) {
        beforeByte_(bytesPlayed_);
      }
      *byte = static_cast<unsigned char>(event.bytes[position_]);
      ++position_;
      return 1;
    }
    const auto silenceMs = static_cast<std::size_t>(event.silenceMs);
    const bool isWholeGap = event.bytes.empty() && silenceMs == kAsLongAsTheGap;
    const std::size_t restMs = event.bytes.empty() ? silenceMs - position_ : 0;
    if (!isWholeGap && restMs > leftMs) {
      position_ += leftMs;
      return 0;
    }
    ++event_;
    position_ = 0;
    leftMs -= isWholeGap ? leftMs : restMs;
    if (leftMs == 0) {
      return 0;
    }
  }
  isPlayed_ = true;
  return 0;
}

void* ReplaySerialFactory::ConvertTo(const char* name) {
  return CompareInterface(name, "ISerialFactory") ? this : nullptr;
}

ISerialPort* ReplaySerialFactory::OpenPort(const char* /*name*/) { return port_; }

void ReplaySerialFactory::ReleasePort(ISerialPort* /*port*/) {}

void* ReplaySemaphore::ConvertTo(const char* name) {
  return CompareInterface(name, "ISemaphore") ? this : nullptr;
}

int ReplaySemaphore::Lock() {
  ++held_;
  return 1;
}

int ReplaySemaphore::Unlock() {
  --held_;
  if (held_ == 0 && whenFree_) {
    whenFree_();
  }
  return 1;
}

void* ReplayTask::ConvertTo(const char* name) {
  return CompareInterface(name, "ITask") ? this : nullptr;
}

void ReplayTask::Run() {
  if (runner_ != nullptr) {
    runner_->Task();
  }
}

void* ReplayMultiTask::ConvertTo(const char* name) {
  return CompareInterface(name, "IMultiTask2") ? this : nullptr;
}

int ReplayMultiTask::StopTask(ITask* /*task*/, int /*timeoutMs*/) { return 1; }

ISemaphore* ReplayMultiTask::CreateSemaphore(int /*reserved*/) { return &semaphore_; }

void ReplayMultiTask::DeleteSemaphore(ISemaphore* /*semaphore*/) {}

void ReplayMultiTask::Sleep(int /*milliseconds*/) {
  if (betweenPasses_) {
    betweenPasses_();
  }
}

ITask* ReplayMultiTask::CreateTask(ITaskRunner* runner, int /*taskClass*/) {
  task_->SetRunner(runner);
  return task_;
}

IInterface* ReplayHost::CreateInterface(const char* name) {
  if (CompareInterface(name, "IMultiTask2")) {
    return &multiTask_;
  }
  if (CompareInterface(name, "ISerialFactory")) {
    return &serialFactory_;
  }
  if (CompareInterface(name, "ISocketFactory")) {
    return &socketFactory_;
  }
  return CompareInterface(name, "ICDSBuffer") ? &cdsBuffer_ : nullptr;
}

void ReplayHost::ReleaseInterface(IInterface* /*interface*/) {}
