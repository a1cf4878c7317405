// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <list>
#include <string>

#include "driver/SerialSettings.h"
#include "interfaces/ISerialPort.h"
#include "protlib/LeafMutex.h"

class ISerialFactory;

// The protocol's serial port, open or closed. Opening and closing belong under the host's port
// semaphore, and so does each received byte, so that a port is not released while the receive task
// waits in it; the callers take that semaphore. What the semaphore does not cover is covered here:
// the port stays alive while a send or a set-up uses it, and while a receive pass runs that a stop
// could not end.
class SerialLink {
 public:
  // The factory may be null: the port then never opens.
  explicit SerialLink(ISerialFactory* factory) : factory_(factory) {}
  SerialLink(const SerialLink&) = delete;
  SerialLink& operator=(const SerialLink&) = delete;
  ~SerialLink() = default;

  bool IsConnected() const { return connected_; }

  // Opens the named port and sets it up. True when the port is open afterwards, also when it
  // already was. A port that cannot be set up is released again. Throws std::bad_alloc, and has
  // then opened nothing.
  bool Open(const std::string& portName, const SerialSettings& settings);

  // Marks the link as closed without touching the port: a receive pass ends at its next byte.
  void Disconnect() { connected_ = false; }

  // Releases the port, if it is open, after the sends that use it. For a caller that holds the port
  // semaphore.
  void Close();

  // The same for a caller without the port semaphore: when a receive pass is still running, the
  // port is released at that pass's end.
  void CloseWithoutSemaphore();

  // Sets an open port up again; the result does not matter. Does nothing without a port.
  void Setup(const SerialSettings& settings);

  // Hands the bytes to the port; what becomes of them is the port's business. False when the link
  // is closed.
  bool Send(const std::string& bytes);

  enum class ReceiveResult { kByte, kTimeout, kClosed };

  // Waits for one byte, unless the link is closed. Only within a ReceivePass and under the port
  // semaphore.
  ReceiveResult Receive(unsigned char& byte, int timeoutMs) {
    ISerialPort* port = connected_ ? port_.load() : nullptr;
    if (port == nullptr) {
      return ReceiveResult::kClosed;
    }
    return port->Receive(&byte, timeoutMs, 0) != 0 ? ReceiveResult::kByte : ReceiveResult::kTimeout;
  }

  // Marks one receive pass of the receive task.
  class ReceivePass {
   public:
    explicit ReceivePass(SerialLink& link) : link_(link) { link_.pass_ = PassState::kRunning; }
    ~ReceivePass() {
      if (link_.pass_.exchange(PassState::kNone) == PassState::kRunningWithPorts) {
        link_.ReleaseKeptPorts();
      }
    }
    ReceivePass(const ReceivePass&) = delete;
    ReceivePass& operator=(const ReceivePass&) = delete;

   private:
    SerialLink& link_;
  };

 private:
  using Ports = std::list<ISerialPort*>;

  enum class PassState { kNone, kRunning, kRunningWithPorts };

  ISerialPort* TakePort();
  void ReleaseKeptPorts();
  bool KeepForPass(ISerialPort* port);
  void DropPlace();
  void Release(ISerialPort* port);

  ISerialFactory* const factory_;
  std::atomic<bool> connected_{false};

  // Held while the port is used from outside the receive task, a send or a set-up in progress
  // included: the one leaf lock that is held across a host call that can block. Nothing is locked
  // inside it but passMutex_'s short sections.
  LeafMutex useMutex_{LockRank::kPortUse};
  std::atomic<ISerialPort*> port_{nullptr};  // written under useMutex_, read by the receive task

  // Each begin and end of a pass is one atomic step: a pass that begins sees that the port is gone,
  // or whoever has taken the port sees the pass. kRunningWithPorts is set under passMutex_.
  std::atomic<PassState> pass_{PassState::kNone};

  LeafMutex passMutex_;
  Ports releaseAfterPass_ LOKA_GUARDED_BY(passMutex_);
  // One for each open port, made when it is opened: to keep a port for the pass needs no memory.
  Ports places_ LOKA_GUARDED_BY(passMutex_);
};
