// SPDX-License-Identifier: Apache-2.0
#include "host/port/PosixSerialFactory.h"

#include <algorithm>
#include <exception>
#include <utility>

#include "host/port/PortList.h"
#include "host/port/PosixSerialPort.h"
#include "interfaces/CompareInterface.h"

PosixSerialFactory::PosixSerialFactory(PortMap ports, PortObserver* observer,
                                       const TerminalCalls& calls)
    : ports_(std::move(ports)), observer_(observer), calls_(calls) {}

PosixSerialFactory::~PosixSerialFactory() = default;

void* PosixSerialFactory::ConvertTo(const char* name) {
  const bool isOurs =
      CompareInterface(name, "PosixSerialFactory") || CompareInterface(name, "ISerialFactory");
  return isOurs ? this : nullptr;
}

std::unique_ptr<PosixSerialPort> PosixSerialFactory::TryOpen(const std::string& name,
                                                             const PortOptions& options,
                                                             PortProblem* problem) const {
  problem->portName = name;
  if (options.path.empty()) {
    problem->kind = PortProblem::Kind::kNotMapped;
    problem->text = "no path is given for this port name";
    return nullptr;
  }
  std::shared_ptr<SerialDevice> device = SerialDevice::Open(options, problem, calls_);
  if (device == nullptr) {
    return nullptr;
  }
  return std::make_unique<PosixSerialPort>(std::move(device), options, observer_, calls_);
}

ISerialPort* PosixSerialFactory::OpenPort(const char* name) {
  if (name == nullptr) {
    return nullptr;
  }
  try {
    const PortOptions options = ports_.OptionsFor(name);
    PortProblem problem;
    std::unique_ptr<PosixSerialPort> port = TryOpen(name, options, &problem);
    if (port != nullptr) {
      NoteStableName(options.path);
    }
    const std::lock_guard<std::mutex> lock(mutex_);
    lastProblem_ = std::move(problem);
    if (port == nullptr) {
      return nullptr;
    }
    open_.push_back({std::move(port), name, options.path});
    return open_.back().port.get();
  } catch (const std::exception& failure) {
    const std::lock_guard<std::mutex> lock(mutex_);
    lastProblem_ = PortProblem{};
    lastProblem_.kind = PortProblem::Kind::kOther;
    lastProblem_.text = failure.what();
    return nullptr;
  }
}

// Numbers of USB adapters change with the order in which they are plugged in.
void PosixSerialFactory::NoteStableName(const std::string& path) {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    if (observer_ == nullptr || !HasChangingName(path) || !notedPaths_.insert(path).second) {
      return;
    }
  }
  const std::string stableName = StableNameOf(path);
  if (!stableName.empty()) {
    observer_->OnPortNote(path + " may get another number when it is plugged in again; " +
                          stableName + " stays the same");
  }
}

void PosixSerialFactory::ReleasePort(ISerialPort* port) {
  OpenPortEntry released;
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    const auto found = std::find_if(open_.begin(), open_.end(),
                                    [&](const auto& entry) { return entry.port.get() == port; });
    if (found == open_.end()) {
      return;
    }
    released = std::move(*found);
    open_.erase(found);
    const std::string setupError = released.port->LastSetupError();
    if (!setupError.empty()) {
      lastProblem_.kind = PortProblem::Kind::kSettings;
      lastProblem_.portName = released.name;
      lastProblem_.path = released.path;
      lastProblem_.text = setupError;
    }
  }
  // Closing may wait for the line; the factory is free meanwhile.
  released.port->Cancel();
  const PortCounters counters = released.port->Counters();
  released.port.reset();
  const std::lock_guard<std::mutex> lock(mutex_);
  releasedCounters_[released.name] += counters;
}

void PosixSerialFactory::CancelAll() {
  const std::lock_guard<std::mutex> lock(mutex_);
  for (const OpenPortEntry& entry : open_) {
    entry.port->Cancel();
  }
}

PortProblem PosixSerialFactory::LastProblem() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return lastProblem_;
}

PortCounters PosixSerialFactory::CountersFor(const std::string& portName) const {
  const std::lock_guard<std::mutex> lock(mutex_);
  const auto released = releasedCounters_.find(portName);
  PortCounters sum = released == releasedCounters_.end() ? PortCounters{} : released->second;
  for (const OpenPortEntry& entry : open_) {
    if (entry.name == portName) {
      sum += entry.port->Counters();
    }
  }
  return sum;
}

ModemLines PosixSerialFactory::LinesOf(const std::string& portName) const {
  const std::lock_guard<std::mutex> lock(mutex_);
  const auto found = std::find_if(open_.begin(), open_.end(), [&](const OpenPortEntry& entry) {
    return entry.name == portName;
  });
  return found == open_.end() ? ModemLines() : found->port->Lines();
}

bool PosixSerialFactory::IsGone(const std::string& portName) const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return std::any_of(open_.begin(), open_.end(), [&](const OpenPortEntry& entry) {
    return entry.name == portName && entry.port->IsGone();
  });
}

std::size_t PosixSerialFactory::PortCount() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return open_.size();
}
