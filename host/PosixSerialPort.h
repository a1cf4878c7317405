// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <atomic>
#include <cstddef>
#include <memory>
#include <mutex>
#include <optional>
#include <string>

#include "host/Deadline.h"
#include "host/LineSettings.h"
#include "host/PortObserver.h"
#include "host/SerialDevice.h"
#include "interfaces/ISerialPort.h"

// One serial port on a terminal device, pseudo-terminals included.
//
// Threads: one thread receives; any number may send and set up meanwhile. A send never makes the
// receiver wait. When the other end hangs up the port stays valid: Receive waits out its time-outs
// in silence and tries the same path again twice a second; once it answers, the last settings are
// put back and bytes flow again.
class PosixSerialPort final : public ISerialPort {
 public:
  // Takes over an open device. `path` is the name under which it is opened again. The observer may
  // be null; otherwise it must outlive the port.
  PosixSerialPort(std::shared_ptr<SerialDevice> device, std::string path, PortObserver* observer);

  // Ends waits that are going on, waits until every call has left, closes.
  ~PosixSerialPort() override;

  PosixSerialPort(const PosixSerialPort&) = delete;
  PosixSerialPort& operator=(const PosixSerialPort&) = delete;

  // Answers "PosixSerialPort" and "ISerialPort".
  void* ConvertTo(const char* name) override;

  void reserved3() override {}
  void reserved4() override {}

  // Sets the line (see LineSettings for the units). 1, or 0 when the settings are not valid or the
  // device refuses them (see LastSetupError). While the line is lost the settings are kept for its
  // return and the answer is 0. Any thread.
  int Setup(int baudrate, int parity, int dataBits, int stopBits, int mode) override;

  // Sends bytes and waits until the system has taken them all, at most timeoutMs milliseconds. 0 or
  // less stands for the port's own limit: 1000 ms and twice the time that these bytes and those
  // still in the output queue need on the line. Returns the number of bytes taken, 0 when the line
  // is lost. Frames of several threads do not mix. Any thread.
  int Send(const unsigned char* data, int lengthBytes, int timeoutMs) override;

  // Waits at most timeoutMs milliseconds for one byte; 0 and less count as 1 ms, so that a caller
  // in a loop never spins. 1 with the byte, or 0. Bytes are read in blocks of up to 4096 and served
  // from there without a system call. One thread at a time.
  int Receive(unsigned char* byte, int timeoutMs, int reserved) override;

  // Makes waits end at once, from now on. For the end of the program, when a receive task sits in a
  // long time-out. Any thread.
  void Cancel();

  // Why the last Setup failed; empty when it did not. Any thread.
  std::string LastSetupError() const;

 private:
  // Counts a call that may be waiting, so that the destructor can wait for it.
  class CallGuard {
   public:
    explicit CallGuard(std::atomic<int>* calls) : calls_(calls) { calls_->fetch_add(1); }
    ~CallGuard() { calls_->fetch_sub(1); }
    CallGuard(const CallGuard&) = delete;
    CallGuard& operator=(const CallGuard&) = delete;

   private:
    std::atomic<int>* const calls_;
  };

  bool WaitAndFill(const Deadline& deadline);
  bool ReadBlock(const Deadline& deadline);
  bool WaitReadable(const Deadline& deadline);
  void Lose(const std::string& why);
  void WaitForReturn(const Deadline& deadline);
  bool TryReturn();
  int SendAll(const SerialDevice& device, const unsigned char* data, int lengthBytes,
              const Deadline& deadline) const;
  std::shared_ptr<SerialDevice> CurrentDevice() const;
  int SendLimitMs(const SerialDevice& device, int lengthBytes) const;

  static constexpr std::size_t kBufferBytes = 4096;
  static constexpr int kReturnIntervalMs = 500;

  // Constant.
  const std::string path_;
  PortObserver* const observer_;
  const int cancelDescriptor_;  // eventfd(2), readable once the port is cancelled

  // Any thread.
  std::atomic<bool> isCancelled_{false};
  std::atomic<int> callsInside_{0};

  // Guarded by stateMutex_, which is held for moments only.
  mutable std::mutex stateMutex_;
  std::shared_ptr<SerialDevice> device_;  // null while the line is lost
  std::optional<LineSettings> settings_;
  std::string setupError_;

  // Keeps frames whole; never taken by Receive.
  std::mutex sendMutex_;

  // Receiving thread only.
  std::shared_ptr<SerialDevice> receiveDevice_;
  std::array<unsigned char, kBufferBytes> buffer_{};
  std::size_t next_ = 0;
  std::size_t end_ = 0;
  ReceiveProgress progress_;
  Deadline nextReturn_ = Deadline::After(0);
  PortProblem::Kind returnProblem_ = PortProblem::Kind::kNone;
};
