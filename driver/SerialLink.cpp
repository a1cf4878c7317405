// SPDX-License-Identifier: Apache-2.0
#include "driver/SerialLink.h"

#include <iterator>

#include "interfaces/ISerialFactory.h"

namespace {

int SetupPort(ISerialPort& port, const SerialSettings& settings) {
  return port.Setup(settings.baudrate, settings.parity, settings.dataBits, settings.stopBits,
                    settings.mode);
}

}  // namespace

bool SerialLink::Open(const std::string& portName, const SerialSettings& settings) {
  if (connected_) {
    return true;
  }
  Ports place(1);
  ISerialPort* port = factory_ == nullptr ? nullptr : factory_->OpenPort(portName.c_str());
  if (port == nullptr) {
    return false;
  }
  if (SetupPort(*port, settings) == 0) {
    Release(port);
    return false;
  }
  ISerialPort* surplus = nullptr;
  {
    const LeafLock lock(useMutex_);
    if (port_ == nullptr) {
      const LeafLock passLock(passMutex_);
      places_.splice(places_.end(), place);
      port_ = port;
    } else {
      surplus = port;  // another thread opened the link meanwhile
    }
    connected_ = true;
  }
  Release(surplus);
  return true;
}

ISerialPort* SerialLink::TakePort() {
  const LeafLock lock(useMutex_);
  connected_ = false;
  return port_.exchange(nullptr);
}

void SerialLink::Release(ISerialPort* port) {
  if (port != nullptr) {
    factory_->ReleasePort(port);
  }
}

void SerialLink::Close() {
  ISerialPort* port = TakePort();
  if (port != nullptr) {
    DropPlace();
    Release(port);
  }
}

void SerialLink::CloseWithoutSemaphore() {
  ISerialPort* port = TakePort();
  if (port != nullptr && !KeepForPass(port)) {
    DropPlace();
    Release(port);
  }
}

void SerialLink::Setup(const SerialSettings& settings) {
  const LeafLock lock(useMutex_);
  ISerialPort* port = port_;
  if (port != nullptr) {
    SetupPort(*port, settings);
  }
}

bool SerialLink::Send(const std::string& bytes) {
  const LeafLock lock(useMutex_);
  ISerialPort* port = port_;
  if (port == nullptr) {
    return false;
  }
  constexpr int kPortsOwnTimeout = 0;
  port->Send(reinterpret_cast<const unsigned char*>(bytes.data()), static_cast<int>(bytes.size()),
             kPortsOwnTimeout);
  return true;
}

void SerialLink::ReleaseKeptPorts() {
  Ports ports;
  {
    const LeafLock lock(passMutex_);
    ports.swap(releaseAfterPass_);
  }
  for (ISerialPort* port : ports) {
    Release(port);
  }
}

// Leaves the port to the receive pass that is running. False when none is.
bool SerialLink::KeepForPass(ISerialPort* port) {
  const LeafLock lock(passMutex_);
  places_.front() = port;
  releaseAfterPass_.splice(releaseAfterPass_.end(), places_, places_.begin());
  PassState state = PassState::kRunning;
  if (pass_.compare_exchange_strong(state, PassState::kRunningWithPorts) ||
      state == PassState::kRunningWithPorts) {
    return true;
  }
  places_.splice(places_.begin(), releaseAfterPass_, std::prev(releaseAfterPass_.end()));
  return false;
}

// Gives up the place of a port that is not kept.
void SerialLink::DropPlace() {
  Ports dropped;  // freed without holding the lock
  const LeafLock lock(passMutex_);
  dropped.splice(dropped.end(), places_, places_.begin());
}
