// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <thread>

#include "host/base/Deadline.h"
#include "host/port/ArrivalClock.h"
#include "host/port/ArrivalQueue.h"
#include "host/port/EchoFilter.h"
#include "host/port/EventSignal.h"
#include "host/port/LineSettings.h"
#include "host/port/ModemLines.h"
#include "host/port/PortCounters.h"
#include "host/port/PortObserver.h"
#include "host/port/PortOptions.h"
#include "host/port/SerialDevice.h"
#include "interfaces/ISerialPort.h"

// One serial port on a terminal device, pseudo-terminals included.
//
// Threads: one thread receives; any number may send and set up meanwhile. A send never makes the
// receiver wait. A thread of the port's own takes what arrives from the line, stamps it and keeps
// it, up to kKeptBytes; beyond that it leaves the bytes to the kernel's buffer, whose overflow the
// line's own counters tell.
//
// When the other end hangs up the port stays valid: Receive waits out its time-outs in silence, and
// the port's thread tries the same device again twice a second; once it answers, the last settings
// are put back and bytes flow again. With reconnect=off it stays lost.
class PosixSerialPort final : public ISerialPort {
 public:
  // What is kept for a receiver that is away.
  static constexpr std::size_t kKeptBytes = std::size_t{1} << 20;

  // Takes over an open device. options.path is the name under which it is opened again; a device
  // that has a name of its own under /dev/serial/by-id is opened by that, since the path may belong
  // to another one by then. The observer may be null; otherwise it must outlive the port, and so
  // must `calls`, with which the device is opened again.
  PosixSerialPort(std::shared_ptr<SerialDevice> device, PortOptions options, PortObserver* observer,
                  const TerminalCalls& calls = TerminalCalls::System());

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
  // still in the output queue need on the line, txdelay included. Returns the number of bytes
  // taken, 0 when the line is lost; what is not taken is counted. Frames of several threads do not
  // mix. Any thread.
  int Send(const unsigned char* data, int lengthBytes, int timeoutMs) override;

  // The next byte when it arrived within timeoutMs milliseconds of the one before, else "time-out",
  // as ArrivalClock decides; 0 and less count as 1 ms. 1 with the byte, or 0. While the line is
  // lost a time-out takes its full time from the call on. Bytes are served from blocks of up to
  // 4096 without a system call or lock. One thread at a time.
  int Receive(unsigned char* byte, int timeoutMs, int reserved) override;

  // Makes waits end at once, from now on. For the end of the program, when a receive task sits in a
  // long time-out. Any thread.
  void Cancel();

  // Why the last Setup failed; empty when it did not. Any thread.
  std::string LastSetupError() const;

  // Counts since the port was opened. Any thread.
  PortCounters Counters() const;

  // The levels of the modem lines; not known while the line is lost. Any thread.
  ModemLines Lines() const;

  // Whether there is no line now, and whether it will stay so (reconnect=off). Any thread.
  bool IsLost() const { return isLost_.load(); }
  bool IsGone() const { return isLost_.load() && !options_.reconnects; }

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

  // How an attempt to read the line went.
  enum class Found { kBytes, kNothing, kEnd, kError };

  // When a byte found by the receiver itself counts as arrived (see ArrivalClock).
  struct Waited {
    std::int64_t deadlineNs;
    std::int64_t timeoutNs;
  };

  // PosixSerialPort.cpp: receiving thread.
  int ReceiveFromNextBlock(unsigned char* byte, int timeoutMs);
  bool AwaitBlock(std::int64_t timeoutNs);
  bool TakeBlock(std::int64_t timeoutNs, bool* isLate);
  void LookAtLine(const Waited& waited);
  void ReportServed();
  int AnswerSilence(int timeoutMs);

  // PosixSerialPort_Line.cpp: the port's own thread, except where said.
  void Serve();
  void ServeLine(const std::shared_ptr<SerialDevice>& device);
  void WaitForRoom();
  Found ReadLine(const SerialDevice& device, const Waited* waited);  // any thread
  void Keep(std::string bytes, std::int64_t arrivedNs);              // any thread
  void StripEcho(std::string* bytes, std::int64_t nowNs);            // any thread
  void Lose(const std::shared_ptr<SerialDevice>& device, const std::string& why, int errorNumber);
  void WaitForReturn();
  bool TryReturn();
  void PutBack(const std::shared_ptr<SerialDevice>& device);
  void Note(const std::string& text) const;  // any thread

  // PosixSerialPort_Send.cpp: sending threads.
  int SendFrame(SerialDevice* device, std::string_view bytes, int timeoutMs);
  int SendAll(const SerialDevice& device, std::string_view bytes, const Deadline& deadline) const;
  int SendSpaced(const SerialDevice& device, std::string_view bytes,
                 const Deadline& deadline) const;
  bool AwaitSent(const SerialDevice& device, const Deadline& deadline) const;
  void CountSend(std::size_t lengthBytes, std::size_t takenBytes);
  int SendLimitMs(const SerialDevice& device, std::size_t lengthBytes) const;
  LineSettings CurrentSettings() const;
  std::shared_ptr<SerialDevice> CurrentDevice() const;  // any thread

  static constexpr int kReturnIntervalMs = 500;

  // Constant.
  const PortOptions options_;
  const std::string returnPath_;
  PortObserver* const observer_;
  const TerminalCalls& calls_;

  // Any thread.
  const EventSignal cancelled_;  // raised once, for good
  const EventSignal hasRoom_;    // the queue was full and is not any more
  ArrivalQueue queue_{kKeptBytes};
  EchoFilter echo_;
  std::atomic<bool> isCancelled_{false};
  std::atomic<bool> isLost_{false};
  std::atomic<int> callsInside_{0};

  // Keeps reading and stamping together, so that blocks stand in the order of their stamps.
  std::mutex readMutex_;

  // Guarded by stateMutex_, which is held for moments only.
  mutable std::mutex stateMutex_;
  std::shared_ptr<SerialDevice> device_;  // null while the line is lost
  std::optional<LineSettings> settings_;
  std::string setupError_;
  std::int64_t lostSinceNs_ = 0;
  PortCounters counters_;  // what is counted under the lock; the rest are the atomics below

  std::atomic<std::uint64_t> receivedBytes_{0};
  std::atomic<std::uint64_t> servedBytes_{0};
  std::atomic<std::uint64_t> lostBytes_{0};
  std::atomic<std::uint64_t> echoBytes_{0};
  std::atomic<std::uint64_t> echoMismatches_{0};

  // Keeps frames whole; never taken by Receive.
  std::mutex sendMutex_;

  // Receiving thread only.
  ArrivedBlock block_;
  std::size_t next_ = 0;
  ArrivalClock clock_;
  ReceiveProgress progress_;

  // The port's own thread only.
  Deadline nextReturn_ = Deadline::After(0);
  PortProblem::Kind returnProblem_ = PortProblem::Kind::kNone;

  std::thread thread_;  // the last member: it uses all others
};
