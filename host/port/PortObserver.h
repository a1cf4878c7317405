// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

// How far the receive side of a port has come.
struct ReceiveProgress {
  std::uint64_t receivedBytes = 0;  // since the port was opened, all of them handed on
  std::uint64_t silences = 0;       // waits that ended without a byte
};

// Hears what happens on the host's ports. Each call must be short and must not call back into the
// port. Threads: OnServed, OnReceivePause and OnSilence come on the receive task, in the order in
// which the driver saw bytes and silences; OnSent comes on the thread that sends; OnLineLost,
// OnLineBack and OnPortNote come on the port's own thread or on the one that opens or sets up the
// port. Calls of different threads may overlap. Times are nanoseconds of CLOCK_MONOTONIC.
class PortObserver {
 public:
  virtual ~PortObserver() = default;

  // The driver has taken these bytes, one block at a time. They arrived within the given times,
  // which are equal for bytes that came in one piece. The view ends with the call. Told when the
  // driver asks for what comes behind them, at the latest when the port is closed.
  virtual void OnServed(std::string_view /*bytes*/, std::int64_t /*firstArrivalNs*/,
                        std::int64_t /*lastArrivalNs*/) {}

  // The driver has taken everything that was received and asks for more: whatever could become of
  // those bytes has been done. Comes each time the port is about to wait, also after a silence.
  virtual void OnReceivePause(const ReceiveProgress& progress) = 0;

  // The driver is about to hear a time-out of timeoutMs milliseconds, behind the bytes of the last
  // OnServed. Exactly once for each.
  virtual void OnSilence(int /*timeoutMs*/) {}

  // The driver has sent these bytes and the line took the first takenBytes of them; 0 while the
  // line is lost. The view ends with the call.
  virtual void OnSent(std::string_view /*bytes*/, std::size_t /*takenBytes*/) {}

  // The other end hung up or the device is gone: `why` in words, and the number of the error that
  // the device answers (errno(3)), 0 when it answers none.
  virtual void OnLineLost(const std::string& path, const std::string& why, int errorNumber) = 0;

  // The same for a port that is not opened again (reconnect=off).
  virtual void OnLineGone(const std::string& path, const std::string& why, int errorNumber) {
    OnLineLost(path, why, errorNumber);
  }

  // The same path answers again and has its settings back.
  virtual void OnLineBack(const std::string& path) = 0;

  // Something the user should know, one line.
  virtual void OnPortNote(const std::string& text) = 0;
};
