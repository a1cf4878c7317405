// SPDX-License-Identifier: Apache-2.0
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <memory>
#include <thread>

#include "host/port/PosixSerialPort.h"
#include "host/port/PseudoTerminal.h"
#include "tests/host/port/CountingObserver.h"
#include "tests/host/support/TestLimit.h"

namespace {

std::unique_ptr<PosixSerialPort> OpenPort(const std::string& path, PortObserver* observer) {
  PortProblem problem;
  std::shared_ptr<SerialDevice> device = SerialDevice::Open(PortOptions::For(path), &problem);
  EXPECT_NE(device, nullptr) << problem.text;
  return std::make_unique<PosixSerialPort>(device, PortOptions::For(path), observer);
}

class PosixSerialPortTest : public testing::Test {
 protected:
  PosixSerialPortTest() : port_(OpenPort(line_.Path(), &observer_)) {}

  void DeviceSends(const std::string& bytes) {
    ASSERT_TRUE(line_.Send(bytes, Deadline::After(kLimitMs)));
  }
  std::string Receive(std::size_t count) {
    std::string bytes;
    unsigned char byte = 0;
    while (bytes.size() < count && port_->Receive(&byte, kLimitMs, 0) != 0) {
      bytes += static_cast<char>(byte);
    }
    return bytes;
  }
  int Send(const std::string& bytes, int timeoutMs) {
    const auto* const data = reinterpret_cast<const unsigned char*>(bytes.data());
    return port_->Send(data, static_cast<int>(bytes.size()), timeoutMs);
  }

  CountingObserver observer_;
  PseudoTerminal line_;
  std::unique_ptr<PosixSerialPort> port_;
};

TEST_F(PosixSerialPortTest, AnswersItsNames) {
  EXPECT_EQ(port_->ConvertTo("ISerialPort"), port_.get());
  EXPECT_EQ(port_->ConvertTo("PosixSerialPort"), port_.get());
  EXPECT_EQ(port_->ConvertTo("ISerialFactory"), nullptr);
}

TEST_F(PosixSerialPortTest, ReceivesEveryByteValueUnchanged) {
  std::string bytes;
  for (int value = 0; value < 256; ++value) {
    bytes += static_cast<char>(static_cast<unsigned char>(value));
  }
  ASSERT_EQ(port_->Setup(9600, 0, 8, 1, 0), 1);
  DeviceSends(bytes + bytes);
  EXPECT_EQ(Receive(512), bytes + bytes);
}

TEST_F(PosixSerialPortTest, SendsEveryByteValueUnchanged) {
  std::string bytes;
  for (int value = 0; value < 256; ++value) {
    bytes += static_cast<char>(static_cast<unsigned char>(value));
  }
  ASSERT_EQ(port_->Setup(9600, 0, 8, 1, 0), 1);
  EXPECT_EQ(Send(bytes, 0), 256);
  std::string seen;
  EXPECT_TRUE(line_.Receive(256, Deadline::After(kLimitMs), &seen));
  EXPECT_EQ(seen, bytes);
}

TEST_F(PosixSerialPortTest, ServesSingleBytesFromOneBlock) {
  DeviceSends(std::string(3000, 'x'));
  EXPECT_EQ(Receive(1), "x");
  // The first wait has been told; everything else comes out of the block without one.
  const int pauses = observer_.Pauses();
  EXPECT_EQ(Receive(2999).size(), 2999U);
  EXPECT_LE(observer_.Pauses() - pauses, 2999 / 100);
}

TEST_F(PosixSerialPortTest, TellsWhenEverythingIsWorkedOff) {
  DeviceSends("ab");
  EXPECT_EQ(Receive(2), "ab");
  unsigned char byte = 0;
  EXPECT_EQ(port_->Receive(&byte, 1, 0), 0);
  EXPECT_EQ(observer_.Progress().receivedBytes, 2U);
  EXPECT_EQ(observer_.Progress().silences, 0U);
  EXPECT_EQ(port_->Receive(&byte, 1, 0), 0);
  EXPECT_EQ(observer_.Progress().silences, 1U);
}

TEST_F(PosixSerialPortTest, TimeOutsOfZeroAndLessComeBack) {
  unsigned char byte = 7;
  EXPECT_EQ(port_->Receive(&byte, 0, 0), 0);
  EXPECT_EQ(port_->Receive(&byte, -1, 0), 0);
  EXPECT_EQ(port_->Receive(&byte, -2147483647, 0), 0);
  EXPECT_EQ(byte, 7);
  EXPECT_EQ(port_->Receive(nullptr, 1, 0), 0);
}

TEST_F(PosixSerialPortTest, TakesEveryValidSetUpOnAPseudoTerminal) {
  for (const int baudrate : {150, 300, 600, 1200, 2400, 4800, 9600, 19200, 38400, 57600, 115200}) {
    for (int parity = 0; parity <= 4; ++parity) {
      for (const int bits : {7, 8}) {
        for (const int stop : {1, 2}) {
          ASSERT_EQ(port_->Setup(baudrate, parity, bits, stop, 0), 1)
              << baudrate << " " << parity << " " << bits << " " << stop << ": "
              << port_->LastSetupError();
        }
      }
    }
  }
}

// A pseudo-terminal keeps 8 bits without parity; the C library reports that as an error only when
// nothing else changes.
TEST_F(PosixSerialPortTest, TakesAFormatThatAPseudoTerminalCannotHave) {
  ASSERT_EQ(port_->Setup(9600, 0, 8, 1, 0), 1);
  EXPECT_EQ(port_->Setup(9600, 0, 7, 1, 0), 1) << port_->LastSetupError();
  ASSERT_EQ(port_->Setup(9600, 0, 8, 1, 0), 1);
  EXPECT_EQ(port_->Setup(9600, 1, 8, 1, 0), 1) << port_->LastSetupError();
  DeviceSends("\x80\xFF");
  EXPECT_EQ(Receive(2), "\x80\xFF");
}

TEST_F(PosixSerialPortTest, RefusesASetUpThatIsNotValidAndSaysWhy) {
  EXPECT_EQ(port_->Setup(9601, 0, 8, 1, 0), 0);
  EXPECT_EQ(port_->LastSetupError().rfind("baud rate 9601 is not one of", 0), 0U);
  EXPECT_EQ(port_->Setup(9600, 0, 8, 1, 0), 1);
  EXPECT_EQ(port_->LastSetupError(), "");
}

TEST_F(PosixSerialPortTest, GoesOnWithANoteWithoutRs485Control) {
  EXPECT_EQ(port_->Setup(9600, 0, 8, 1, 1), 1);
  ASSERT_EQ(observer_.Notes().size(), 1U);
  EXPECT_NE(observer_.Notes()[0].find("RS-485"), std::string::npos);
  EXPECT_EQ(port_->Setup(9600, 0, 8, 1, 2), 1);
  EXPECT_EQ(port_->Setup(9600, 0, 8, 1, 0), 1);
  EXPECT_EQ(observer_.Notes().size(), 1U);
}

TEST_F(PosixSerialPortTest, SendsMoreThanTheSystemTakesAtOnce) {
  const std::string bytes(300000, 'y');
  std::string seen;
  std::thread device(
      [&] { EXPECT_TRUE(line_.Receive(bytes.size(), Deadline::After(kLimitMs), &seen)); });
  EXPECT_EQ(Send(bytes, kLimitMs), static_cast<int>(bytes.size()));
  device.join();
  EXPECT_EQ(seen, bytes);
}

TEST_F(PosixSerialPortTest, SendEndsWhenNobodyReads) {
  const std::string bytes(1000000, 'y');
  const int sent = Send(bytes, 1);
  EXPECT_GT(sent, 0);
  EXPECT_LT(sent, static_cast<int>(bytes.size()));
  std::string seen;
  EXPECT_TRUE(line_.Receive(static_cast<std::size_t>(sent), Deadline::After(kLimitMs), &seen));
}

TEST_F(PosixSerialPortTest, SendRefusesNothingToSend) {
  const unsigned char byte = 1;
  EXPECT_EQ(port_->Send(nullptr, 1, 0), 0);
  EXPECT_EQ(port_->Send(&byte, 0, 0), 0);
  EXPECT_EQ(port_->Send(&byte, -1, 0), 0);
}

TEST_F(PosixSerialPortTest, ReceivesAndSetsUpWhileASendIsStuck) {
  std::atomic<int> sent{-1};
  std::thread sender([&] { sent = Send(std::string(1000000, 'y'), kLimitMs); });
  // Once bytes come out at the other end the send is under way, and far from its end.
  std::string seen;
  ASSERT_TRUE(line_.Receive(1, Deadline::After(kLimitMs), &seen));
  DeviceSends("abc");
  EXPECT_EQ(Receive(3), "abc");
  EXPECT_EQ(port_->Setup(19200, 0, 8, 1, 0), 1);
  EXPECT_EQ(sent, -1);
  port_->Cancel();
  sender.join();
  EXPECT_LT(sent, 1000000);
}

TEST_F(PosixSerialPortTest, FramesOfSeveralThreadsDoNotMix) {
  constexpr int kFrames = 50;
  constexpr std::size_t kFrameBytes = 3000;
  std::string seen;
  std::thread device([&] {
    EXPECT_TRUE(line_.Receive(2 * kFrames * kFrameBytes, Deadline::After(kLimitMs), &seen));
  });
  const auto sendAll = [&](char letter) {
    for (int i = 0; i < kFrames; ++i) {
      EXPECT_EQ(Send(std::string(kFrameBytes, letter), kLimitMs), static_cast<int>(kFrameBytes));
    }
  };
  std::thread first(sendAll, 'a');
  std::thread second(sendAll, 'b');
  first.join();
  second.join();
  device.join();
  for (std::size_t at = 0; at < seen.size(); at += kFrameBytes) {
    EXPECT_EQ(seen.substr(at, kFrameBytes), std::string(kFrameBytes, seen[at])) << at;
  }
}

TEST_F(PosixSerialPortTest, CancelEndsAWaitAtOnce) {
  std::thread canceller([&] {
    while (observer_.Pauses() == 0) {
      std::this_thread::yield();
    }
    port_->Cancel();
  });
  unsigned char byte = 0;
  // An hour, which the time-out of the test would not allow.
  EXPECT_EQ(port_->Receive(&byte, 3600 * 1000, 0), 0);
  canceller.join();
}

TEST_F(PosixSerialPortTest, ClosingWaitsForACallInside) {
  std::atomic<bool> hasLeft{false};
  PosixSerialPort* const port = port_.get();
  std::thread receiver([&, port] {
    unsigned char byte = 0;
    (void)port->Receive(&byte, 3600 * 1000, 0);
    hasLeft = true;
  });
  while (observer_.Pauses() == 0) {
    std::this_thread::yield();
  }
  port_.reset();
  receiver.join();
  EXPECT_TRUE(hasLeft);
}

TEST_F(PosixSerialPortTest, MarksTheDeviceAsItsOwnAndTakesTheMarkAway) {
  // A second file on the device, as the other end of the pair keeps one; the mark would last on it.
  const int watcher = open(line_.Path().c_str(), O_RDWR | O_NOCTTY);
  int isExclusive = 0;
  if (watcher < 0) {
    // The mark keeps everybody but root out.
    EXPECT_EQ(errno, EBUSY);
  } else {
    EXPECT_EQ(ioctl(watcher, TIOCGEXCL, &isExclusive), 0);
    EXPECT_NE(isExclusive, 0);
  }
  port_.reset();
  const int later = open(line_.Path().c_str(), O_RDWR | O_NOCTTY);
  ASSERT_GE(later, 0);
  EXPECT_EQ(ioctl(later, TIOCGEXCL, &isExclusive), 0);
  EXPECT_EQ(isExclusive, 0);
  close(later);
  if (watcher >= 0) {
    close(watcher);
  }
}

// The driver is away: the port keeps a bounded part and leaves the rest to the sender's side.
TEST_F(PosixSerialPortTest, KeepsABoundedPartForADriverThatIsAway) {
  const std::string bytes(3 * PosixSerialPort::kKeptBytes, 'x');
  std::thread device([&] { DeviceSends(bytes); });
  // Nothing is lost: once the driver reads, the device gets rid of everything.
  std::uint64_t before = 0;
  while (port_->Counters().receivedBytes == 0 || port_->Counters().receivedBytes != before) {
    before = port_->Counters().receivedBytes;
    Deadline::After(50).Sleep();
  }
  EXPECT_LE(before, PosixSerialPort::kKeptBytes + 4096);
  EXPECT_EQ(Receive(bytes.size()).size(), bytes.size());
  device.join();
}

TEST_F(PosixSerialPortTest, TellsServedBytesAndSilencesInOrder) {
  DeviceSends("ab");
  EXPECT_EQ(Receive(1), "a");
  EXPECT_EQ(observer_.Story(), "");
  EXPECT_EQ(Receive(1), "b");
  unsigned char byte = 0;
  EXPECT_EQ(port_->Receive(&byte, 7, 0), 0);
  DeviceSends("c");
  EXPECT_EQ(Receive(1), "c");
  EXPECT_EQ(observer_.Story(), "ab.7");
  EXPECT_EQ(Send("xy", 0), 2);
  port_.reset();
  EXPECT_EQ(observer_.Story(), "ab.7>xy(2)c");
}

TEST(PosixSerialPortHangUp, IsToldOnceAndSendsAreRefused) {
  CountingObserver observer;
  auto line = std::make_unique<PseudoTerminal>();
  const std::string path = line->Path();
  const auto port = OpenPort(path, &observer);
  ASSERT_EQ(port->Setup(9600, 0, 8, 1, 0), 1);
  ASSERT_TRUE(line->Send("ab", Deadline::After(kLimitMs)));
  unsigned char byte = 0;
  ASSERT_EQ(port->Receive(&byte, kLimitMs, 0), 1);
  line.reset();
  ASSERT_TRUE(observer.AwaitNotes(1, kLimitMs));
  // What was received before still comes.
  EXPECT_EQ(port->Receive(&byte, 1, 0), 1);
  EXPECT_EQ(byte, 'b');
  EXPECT_EQ(port->Receive(&byte, 1, 0), 0);
  EXPECT_EQ(port->Receive(&byte, 1, 0), 0);
  EXPECT_EQ(observer.Notes(),
            std::vector<std::string>{"lost " + path + ": the other end hung up EIO"});
  EXPECT_EQ(port->Send(&byte, 1, 0), 0);
  EXPECT_EQ(port->Setup(19200, 0, 8, 1, 0), 0);
  EXPECT_EQ(port->LastSetupError(), "the line is lost");
}

}  // namespace
