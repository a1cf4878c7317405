// SPDX-License-Identifier: Apache-2.0
#include <fcntl.h>
#include <gtest/gtest.h>
#include <termios.h>
#include <unistd.h>

#include <chrono>
#include <fstream>
#include <memory>
#include <sstream>

#include "host/port/PosixSerialPort.h"
#include "host/port/PseudoTerminal.h"
#include "tests/host/port/CountingObserver.h"
#include "tests/host/port/LockingProcess.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/support/ProgramRun.h"
#include "tests/host/support/TemporaryFolder.h"
#include "tests/host/support/TestLimit.h"

namespace fs = std::filesystem;

namespace {

// A line under a name that stays when another pseudo-terminal takes its place.
class ReplaceableLine {
 public:
  ReplaceableLine() { Connect(); }
  void Connect() {
    line_ = std::make_unique<PseudoTerminal>();
    fs::create_symlink(line_->Path(), Path());
  }
  void Disconnect() {
    fs::remove(Path());
    line_.reset();
  }
  std::string Path() const { return folder_.File("line"); }
  PseudoTerminal* operator->() const { return line_.get(); }

 private:
  TemporaryFolder folder_;
  std::unique_ptr<PseudoTerminal> line_;
};

std::unique_ptr<PosixSerialPort> OpenPort(const std::string& path, PortObserver* observer) {
  PortProblem problem;
  std::shared_ptr<SerialDevice> device = SerialDevice::Open(PortOptions::For(path), &problem);
  EXPECT_NE(device, nullptr) << problem.text;
  return std::make_unique<PosixSerialPort>(device, PortOptions::For(path), observer);
}

// What the system has set for a line.
termios SettingsOf(const std::string& path) {
  termios settings{};
  const int descriptor = open(path.c_str(), O_RDWR | O_NOCTTY | O_CLOEXEC);
  EXPECT_EQ(tcgetattr(descriptor, &settings), 0) << path;
  (void)close(descriptor);
  return settings;
}

// Processor time of a process in milliseconds.
long ProcessorMs(int processId) {
  std::ifstream file("/proc/" + std::to_string(processId) + "/stat");
  std::string line;
  std::getline(file, line);
  std::istringstream fields(line.substr(line.rfind(')') + 1));
  std::string skipped;
  for (int field = 3; field < 14; ++field) {
    fields >> skipped;
  }
  long user = 0;
  long system = 0;
  fields >> user >> system;
  return (user + system) * 1000 / sysconf(_SC_CLK_TCK);
}

TEST(HangUp, ReceiveWaitsItsTimeOutsOut) {
  auto line = std::make_unique<PseudoTerminal>();
  CountingObserver observer;
  const auto port = OpenPort(line->Path(), &observer);
  line.reset();
  ASSERT_TRUE(observer.AwaitNotes(1, kLimitMs));
  // Not early is what counts; late is the machine's business.
  for (int round = 0; round < 3; ++round) {
    const auto begin = std::chrono::steady_clock::now();
    unsigned char byte = 0;
    EXPECT_EQ(port->Receive(&byte, 30, 0), 0);
    EXPECT_GE(std::chrono::steady_clock::now() - begin, std::chrono::milliseconds(30));
  }
}

TEST(HangUp, LineThatComesBackIsOpenedAgainWithItsSettings) {
  CountingObserver observer;
  ReplaceableLine line;
  const auto port = OpenPort(line.Path(), &observer);
  ASSERT_EQ(port->Setup(9600, 1, 8, 1, 0), 1);
  line.Disconnect();
  ASSERT_TRUE(observer.AwaitNotes(1, kLimitMs));
  unsigned char byte = 0;
  // Set while the line is away, in effect once it is back.
  EXPECT_EQ(port->Setup(19200, 0, 8, 1, 0), 0);
  line.Connect();
  ASSERT_TRUE(line->Send("z", Deadline::After(kLimitMs)));
  ASSERT_EQ(port->Receive(&byte, kLimitMs, 0), 1);
  EXPECT_EQ(byte, 'z');
  ASSERT_EQ(observer.Notes().size(), 2U);
  EXPECT_EQ(observer.Notes()[1], "back " + line.Path());
  const termios settings = SettingsOf(line.Path());
  EXPECT_EQ(cfgetospeed(&settings), static_cast<speed_t>(B19200));
  EXPECT_EQ(settings.c_lflag & (ICANON | ECHO), 0U);
  EXPECT_EQ(port->Send(&byte, 1, 0), 1);
  std::string seen;
  EXPECT_TRUE(line->Receive(1, Deadline::After(kLimitMs), &seen));
  EXPECT_EQ(seen, "z");
}

TEST(HangUp, SomebodysTerminalIsNotTakenForTheLine) {
  ReplaceableLine line;
  CountingObserver observer;
  const auto port = OpenPort(line.Path(), &observer);
  line.Disconnect();
  ASSERT_TRUE(observer.AwaitNotes(1, kLimitMs));
  unsigned char byte = 0;
  line.Connect();
  {
    const SessionProcess login(line.Path());
    ASSERT_TRUE(line->Send("typed by somebody", Deadline::After(kLimitMs)));
    // Three times the interval at which the port looks for its line.
    EXPECT_EQ(port->Receive(&byte, 1500, 0), 0);
    EXPECT_EQ(observer.Notes().size(), 1U);
  }
}

TEST(HangUp, SendsWhileTheLineIsLostAreCounted) {
  CountingObserver observer;
  ReplaceableLine line;
  const auto port = OpenPort(line.Path(), &observer);
  line.Disconnect();
  ASSERT_TRUE(observer.AwaitNotes(1, kLimitMs));
  const unsigned char bytes[3] = {1, 2, 3};
  EXPECT_EQ(port->Send(bytes, 3, 0), 0);
  EXPECT_EQ(port->Send(bytes, 2, 0), 0);
  EXPECT_TRUE(port->IsLost());
  EXPECT_FALSE(port->IsGone());
  line.Connect();
  ASSERT_TRUE(observer.AwaitNotes(2, kLimitMs));
  EXPECT_EQ(port->Send(bytes, 1, 0), 1);
  const PortCounters counters = port->Counters();
  EXPECT_EQ(counters.sends, 3U);
  EXPECT_EQ(counters.sentBytes, 1U);
  EXPECT_EQ(counters.lostSends, 2U);
  EXPECT_EQ(counters.lostSendBytes, 5U);
  EXPECT_EQ(counters.losses, 1U);
  EXPECT_EQ(counters.reconnects, 1U);
  // The port looks for its line every half second, the first time half a second after the loss.
  EXPECT_GE(counters.lostMs, 500U);
}

TEST(HangUp, LossIsFinalWithoutReconnect) {
  CountingObserver observer;
  ReplaceableLine line;
  PortOptions options = PortOptions::For(line.Path());
  options.reconnects = false;
  PortProblem problem;
  PosixSerialPort port(SerialDevice::Open(options, &problem), options, &observer);
  line.Disconnect();
  ASSERT_TRUE(observer.AwaitNotes(1, kLimitMs));
  line.Connect();
  ASSERT_TRUE(line->Send("z", Deadline::After(kLimitMs)));
  unsigned char byte = 0;
  // Three times the interval at which a port looks for its line.
  EXPECT_EQ(port.Receive(&byte, 1500, 0), 0);
  EXPECT_TRUE(port.IsGone());
  EXPECT_EQ(observer.Notes().size(), 1U);
  EXPECT_EQ(port.Counters().reconnects, 0U);
}

// Two seconds of measuring; 2 % of them are 40 ms.
TEST(HangUp, WatchDoesNotSpinAndGoesOnWhenTheLineIsBack) {
  constexpr int kMeasureMs = 2000;
  constexpr long kMostMs = kMeasureMs * 2 / 100;
  ReplaceableLine line;
  ProgramRun sub({"sub", "-F", "%t  %l  \"%p\"  %x", "--no-store", "--port", line.Path(),
                  "--config", TestConfiguration("rx_prefix=02 rx_suffix=03 gap=20")});
  ASSERT_TRUE(sub.AwaitErrors("queue 100")) << sub.Errors();
  ASSERT_TRUE(
      line->Send("\x02"
                 "one\x03",
                 Deadline::After(kLimitMs)));
  EXPECT_NE(sub.Line().find("\"one\""), std::string::npos);

  line.Disconnect();
  ASSERT_TRUE(sub.AwaitErrors(line.Path() + ": line lost")) << sub.Errors();
  const long before = ProcessorMs(sub.ProcessId());
  Deadline::After(kMeasureMs).Sleep();
  const long used = ProcessorMs(sub.ProcessId()) - before;
  RecordProperty("processor_ms_while_lost", static_cast<int>(used));
  EXPECT_LT(used, kMostMs);

  line.Connect();
  ASSERT_TRUE(sub.AwaitErrors(line.Path() + ": line is back")) << sub.Errors();
  ASSERT_TRUE(
      line->Send("\x02"
                 "two\x03",
                 Deadline::After(kLimitMs)));
  EXPECT_NE(sub.Line().find("\"two\""), std::string::npos);
  line.Disconnect();
  ASSERT_TRUE(sub.AwaitErrors(line.Path() + ": line lost")) << sub.Errors();
  sub.Signal(SIGINT);
  EXPECT_EQ(sub.Status(), 128 + SIGINT);
}

TEST(HangUp, IdleWatchUsesHardlyAnyProcessorTime) {
  constexpr int kMeasureMs = 2000;
  constexpr long kMostMs = kMeasureMs * 2 / 100;
  const PseudoTerminal line;
  ProgramRun sub({"sub", "-F", "%t  %l  \"%p\"  %x", "--no-store", "--port", line.Path(),
                  "--config", TestConfiguration("rx_prefix=02 rx_suffix=03")});
  ASSERT_TRUE(sub.AwaitErrors("queue 100")) << sub.Errors();
  const long before = ProcessorMs(sub.ProcessId());
  Deadline::After(kMeasureMs).Sleep();
  EXPECT_LT(ProcessorMs(sub.ProcessId()) - before, kMostMs);
}

}  // namespace
