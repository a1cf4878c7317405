// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

#include "host/port/LineSettings.h"
#include "host/port/ModemLines.h"
#include "host/port/PortCounters.h"
#include "host/port/PortOptions.h"
#include "host/port/PortProblem.h"
#include "host/port/TerminalCalls.h"

// An open terminal device that belongs to this process alone: flock(2), which stops everybody who
// asks, and TIOCEXCL (ioctl_tty(2)), which stops everybody but root. Raw from the first moment on,
// not blocking, never the controlling terminal.
class SerialDevice {
 public:
  // Opens options.path and does what the options ask for at opening: exclusive use and raw mode
  // always, then DTR, RTS, low latency, flush. Null, with the reason in `problem`, when the path is
  // not there, not a terminal device, not allowed or held by somebody. What the line cannot do
  // although it was asked for stands in OpeningNotes. `calls` must outlive the device. Any thread.
  static std::shared_ptr<SerialDevice> Open(const PortOptions& options, PortProblem* problem,
                                            const TerminalCalls& calls = TerminalCalls::System());

  // Waits for bytes still on their way out for as long as the line needs, at most 2000 ms, drops
  // the rest and closes. A lost device is closed at once. Line settings stay as they are; low
  // latency that Open has switched on is switched off again.
  ~SerialDevice();

  SerialDevice(const SerialDevice&) = delete;
  SerialDevice& operator=(const SerialDevice&) = delete;

  // Sets rate, character format and RS-485 direction control. False, with the reason in `why`, when
  // the settings are not valid or the device refuses them. `note` gets a text when the kernel
  // cannot control the direction and the port goes on without (rs485=auto). What the device made of
  // the settings is not read back: a pseudo-terminal always reads back 8 bits without parity. Any
  // thread.
  bool Apply(const LineSettings& settings, std::string* why, std::string* note);

  // The open file; valid as long as the object. Any thread.
  int FileDescriptor() const { return fileDescriptor_; }

  // Bytes in the output queue (TIOCOUTQ); 0 where the device does not tell. Any thread.
  int PendingBytes() const;

  // Whether RTS has to be switched by hand around a send (rs485=rts and a mode that needs it), and
  // the switch: on for sending, off for receiving. False, with errno, when the line cannot. Any
  // thread.
  bool NeedsRts() const { return needsRts_.load(); }
  bool SetRts(bool isOn) const;

  // The levels of the modem lines now. Any thread.
  ModemLines Lines() const;

  // Waits until everything has left, the last stop bit included (tcdrain(3)). Any thread.
  void Drain() const { (void)calls_.Drain(fileDescriptor_); }

  // The line's own counts since Open; a lost line keeps the last ones that it told. Any thread.
  LineErrors Errors() const;

  // What the line could not do although an option asked for it, one line each. Any thread.
  const std::vector<std::string>& OpeningNotes() const { return openingNotes_; }

  // The error that the device answers to every request, 0 when it answers. Any thread.
  int ErrorNumber() const;

  // Says that the other end is gone. Port's own thread, before the last reference goes.
  void MarkLost() { isLost_ = true; }

 private:
  SerialDevice(int fileDescriptor, PortOptions options, const TerminalCalls& calls)
      : fileDescriptor_(fileDescriptor), options_(std::move(options)), calls_(calls) {}

  bool MakeRaw() const;
  bool SetLine(const termios& line) const;
  void ApplyOpeningOptions();
  void SetModemLine(const char* name, PortOptions::Level level, int bit);
  void LowerLatency();
  void RestoreLatency() const;
  bool ApplyDirection(int mode, std::string* why, std::string* note);
  LineErrors ReadErrors() const;
  void DrainForAWhile() const;

  // Constant after Open.
  const int fileDescriptor_;
  const PortOptions options_;
  const TerminalCalls& calls_;
  std::vector<std::string> openingNotes_;
  LineErrors firstErrors_;
  bool hasLoweredLatency_ = false;

  std::atomic<bool> needsRts_{false};
  bool isLost_ = false;
  mutable std::mutex errorsMutex_;
  mutable LineErrors lastErrors_;
};
