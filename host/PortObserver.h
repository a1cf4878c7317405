// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

// How far the receive side of a port has come.
struct ReceiveProgress {
  std::uint64_t receivedBytes = 0;  // since the port was opened, all of them handed on
  std::uint64_t silences = 0;       // waits that ended without a byte
};

// Hears what happens on the host's ports. Called on the thread on which it happens, mostly the
// receive task, so each call must be short and must not call back into the port.
class PortObserver {
 public:
  virtual ~PortObserver() = default;

  // The driver has taken everything that was received and asks for more: whatever could become of
  // those bytes has been done. Comes each time the port is about to wait, also after a silence.
  virtual void OnReceivePause(const ReceiveProgress& progress) = 0;

  // The other end hung up or the device is gone, and the same path answers again.
  virtual void OnLineLost(const std::string& path, const std::string& why) = 0;
  virtual void OnLineBack(const std::string& path) = 0;

  // Something the user should know, one line.
  virtual void OnPortNote(const std::string& text) = 0;
};
