// SPDX-License-Identifier: Apache-2.0
#include "host/PosixSerialFactory.h"

#include <algorithm>
#include <exception>
#include <utility>

#include "host/PosixSerialPort.h"
#include "interfaces/CompareInterface.h"

PosixSerialFactory::PosixSerialFactory(PortMap ports, PortObserver* observer)
    : ports_(std::move(ports)), observer_(observer) {}

PosixSerialFactory::~PosixSerialFactory() = default;

void* PosixSerialFactory::ConvertTo(const char* name) {
  const bool isOurs =
      CompareInterface(name, "PosixSerialFactory") || CompareInterface(name, "ISerialFactory");
  return isOurs ? this : nullptr;
}

std::unique_ptr<PosixSerialPort> PosixSerialFactory::TryOpen(const std::string& name,
                                                             const std::string& path,
                                                             PortProblem* problem) const {
  problem->portName = name;
  if (path.empty()) {
    problem->kind = PortProblem::Kind::kNotMapped;
    problem->text = "no path is given for this port name";
    return nullptr;
  }
  std::shared_ptr<SerialDevice> device = SerialDevice::Open(path, problem);
  if (device == nullptr) {
    return nullptr;
  }
  return std::make_unique<PosixSerialPort>(std::move(device), path, observer_);
}

ISerialPort* PosixSerialFactory::OpenPort(const char* name) {
  if (name == nullptr) {
    return nullptr;
  }
  try {
    const std::string path = ports_.PathFor(name);
    PortProblem problem;
    std::unique_ptr<PosixSerialPort> port = TryOpen(name, path, &problem);
    const std::lock_guard<std::mutex> lock(mutex_);
    lastProblem_ = std::move(problem);
    if (port == nullptr) {
      return nullptr;
    }
    open_.push_back({std::move(port), name, path});
    return open_.back().port.get();
  } catch (const std::exception& failure) {
    const std::lock_guard<std::mutex> lock(mutex_);
    lastProblem_ = PortProblem{};
    lastProblem_.kind = PortProblem::Kind::kOther;
    lastProblem_.text = failure.what();
    return nullptr;
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
  released.port.reset();
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

std::size_t PosixSerialFactory::PortCount() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return open_.size();
}
