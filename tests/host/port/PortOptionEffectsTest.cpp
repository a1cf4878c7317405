// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "host/port/PosixSerialPort.h"
#include "host/port/PseudoTerminal.h"
#include "interfaces/ISerialPort.h"
#include "tests/host/port/CountingObserver.h"
#include "tests/host/port/FakeTerminalCalls.h"
#include "tests/host/support/TestLimit.h"

namespace {

using Calls = std::vector<std::string>;

class PortOptionEffectsTest : public testing::Test {
 protected:
  void Open(const std::string& optionText) {
    PortOptions options;
    std::string error;
    ASSERT_TRUE(ParsePortOptions(line_.Path() + optionText, &options, &error)) << error;
    PortProblem problem;
    auto device = SerialDevice::Open(options, &problem, calls_);
    ASSERT_NE(device, nullptr) << problem.text;
    port_ = std::make_unique<PosixSerialPort>(std::move(device), options, &observer_, calls_);
  }
  int SetLine(int mode) { return port_->Setup(9600, 0, 8, 1, mode); }
  int Send(const std::string& bytes) {
    return port_->Send(reinterpret_cast<const unsigned char*>(bytes.data()),
                       static_cast<int>(bytes.size()), 0);
  }
  // What the device got.
  std::string Sent(std::size_t count) {
    std::string bytes;
    EXPECT_TRUE(line_.Receive(count, Deadline::After(kLimitMs), &bytes));
    return bytes;
  }
  std::string Receive(std::size_t count) {
    std::string bytes;
    unsigned char byte = 0;
    while (bytes.size() < count && port_->Receive(&byte, kLimitMs, 0) != 0) {
      bytes += static_cast<char>(byte);
    }
    return bytes;
  }

  CountingObserver observer_;
  FakeTerminalCalls calls_;
  PseudoTerminal line_;
  std::unique_ptr<PosixSerialPort> port_;
};

TEST_F(PortOptionEffectsTest, TouchesNoModemLineUnlessAsked) {
  Open("");
  EXPECT_EQ(SetLine(kModeRs232), 1);
  EXPECT_EQ(calls_.asked, Calls{});
  EXPECT_EQ(calls_.line.c_cflag & CRTSCTS, 0U);
}

TEST_F(PortOptionEffectsTest, SetsModemLinesAndFlushesAtOpening) {
  Open(",dtr=off,rts=on,flush=on");
  EXPECT_EQ(calls_.asked, (Calls{"dtr-", "rts+", "flush"}));
  EXPECT_TRUE(observer_.Notes().empty());
}

TEST_F(PortOptionEffectsTest, SaysWhenALineHasNoModemLines) {
  calls_.hasModemLines = false;
  Open(",dtr=off,rts=on");
  ASSERT_EQ(observer_.Notes().size(), 2U);
  EXPECT_EQ(observer_.Notes()[0].rfind(line_.Path() + ": dtr=off has no effect", 0), 0U);
  EXPECT_EQ(observer_.Notes()[1].rfind(line_.Path() + ": rts=on has no effect", 0), 0U);
}

TEST_F(PortOptionEffectsTest, TellsTheLevelsOfTheModemLines) {
  Open("");
  for (const int bit : {TIOCM_DTR, TIOCM_RTS, TIOCM_CTS, TIOCM_DSR, TIOCM_CAR, TIOCM_RNG}) {
    calls_.modemBits = bit;
    const ModemLines lines = port_->Lines();
    EXPECT_TRUE(lines.areKnown);
    EXPECT_EQ(lines.dtr, bit == TIOCM_DTR);
    EXPECT_EQ(lines.rts, bit == TIOCM_RTS);
    EXPECT_EQ(lines.cts, bit == TIOCM_CTS);
    EXPECT_EQ(lines.dsr, bit == TIOCM_DSR);
    EXPECT_EQ(lines.dcd, bit == TIOCM_CAR);
    EXPECT_EQ(lines.ri, bit == TIOCM_RNG);
  }
  calls_.hasModemLines = false;
  EXPECT_FALSE(port_->Lines().areKnown);
}

TEST_F(PortOptionEffectsTest, FlowControlAndClosingStandInTheLine) {
  Open(",flow=rtscts,hupcl=off");
  ASSERT_EQ(SetLine(kModeRs232), 1);
  EXPECT_NE(calls_.line.c_cflag & CRTSCTS, 0U);
  EXPECT_EQ(calls_.line.c_cflag & HUPCL, 0U);
  port_.reset();
  Open(",flow=xonxoff,hupcl=on");
  ASSERT_EQ(SetLine(kModeRs232), 1);
  EXPECT_EQ(calls_.line.c_cflag & CRTSCTS, 0U);
  EXPECT_EQ(calls_.line.c_iflag & (IXON | IXOFF), static_cast<tcflag_t>(IXON | IXOFF));
  EXPECT_EQ(calls_.line.c_cc[VSTART], 0x11);
  EXPECT_EQ(calls_.line.c_cc[VSTOP], 0x13);
  EXPECT_NE(calls_.line.c_cflag & HUPCL, 0U);
}

TEST_F(PortOptionEffectsTest, Rs485IsLeftToTheKernelWhereItCan) {
  Open("");
  EXPECT_EQ(SetLine(kModeRs485), 1);
  EXPECT_EQ(calls_.asked, Calls{"rs485 on"});
  EXPECT_TRUE(observer_.Notes().empty());
  EXPECT_EQ(SetLine(kModeRs232), 1);
  EXPECT_EQ(calls_.asked, (Calls{"rs485 on", "rs485 off"}));
}

TEST_F(PortOptionEffectsTest, Rs485AutoGoesOnWithANoteAndIoctlInsists) {
  calls_.hasRs485 = false;
  Open(",rs485=auto");
  EXPECT_EQ(SetLine(kModeRs485), 1);
  EXPECT_EQ(observer_.Notes().size(), 1U);
  port_.reset();
  Open(",rs485=ioctl");
  EXPECT_EQ(SetLine(kModeRs485), 0);
  EXPECT_EQ(port_->LastSetupError(),
            "rs485=ioctl: the kernel cannot control the RS-485 direction of this port");
  // A line without a direction does not need it.
  EXPECT_EQ(SetLine(kModeRs422), 1);
}

TEST_F(PortOptionEffectsTest, Rs485OffNeverAsks) {
  Open(",rs485=off");
  EXPECT_EQ(SetLine(kModeRs485), 1);
  EXPECT_EQ(calls_.asked, Calls{});
}

TEST_F(PortOptionEffectsTest, Rs485RtsIsOnAroundEachSend) {
  Open(",rs485=rts");
  ASSERT_EQ(SetLine(kModeRs485), 1);
  EXPECT_EQ(calls_.asked, Calls{"rts-"});
  EXPECT_EQ(Send("abc"), 3);
  EXPECT_EQ(calls_.asked, (Calls{"rts-", "rts+", "drain", "rts-"}));
  ASSERT_EQ(SetLine(kModeRs232), 1);
  EXPECT_EQ(Send("d"), 1);
  EXPECT_EQ(calls_.asked.size(), 4U);
  EXPECT_EQ(Sent(4), "abcd");
}

TEST_F(PortOptionEffectsTest, Rs485RtsNeedsAnRtsLine) {
  calls_.hasModemLines = false;
  Open(",rs485=rts");
  EXPECT_EQ(SetLine(kModeRs485), 0);
  EXPECT_EQ(port_->LastSetupError().rfind("rs485=rts: the line cannot switch RTS", 0), 0U);
}

TEST_F(PortOptionEffectsTest, LowLatencyIsSwitchedOnAndBack) {
  Open("");
  EXPECT_TRUE(calls_.IsLowLatency());
  port_.reset();
  EXPECT_FALSE(calls_.IsLowLatency());
  Open(",latency=keep");
  EXPECT_FALSE(calls_.IsLowLatency());
  port_.reset();
  // Somebody else has switched it on: it stays on.
  calls_.serial.flags = static_cast<int>(ASYNC_LOW_LATENCY);
  Open(",latency=low");
  port_.reset();
  EXPECT_TRUE(calls_.IsLowLatency());
}

TEST_F(PortOptionEffectsTest, LineErrorsCountFromTheOpening) {
  calls_.counts.frame = 5;
  calls_.counts.overrun = -1;  // the kernel's number is about to start again at 0
  Open("");
  calls_.counts.frame = 8;
  calls_.counts.parity = 2;
  calls_.counts.overrun = 1;
  calls_.counts.brk = 1;
  calls_.counts.buf_overrun = 4;
  const LineErrors errors = port_->Counters().lineErrors;
  EXPECT_TRUE(errors.areKnown);
  EXPECT_EQ(errors.framing, 3U);
  EXPECT_EQ(errors.parity, 2U);
  EXPECT_EQ(errors.overruns, 2U);
  EXPECT_EQ(errors.breaks, 1U);
  EXPECT_EQ(errors.bufferOverruns, 4U);
}

TEST_F(PortOptionEffectsTest, LineWithoutCountersSaysSo) {
  calls_.hasCounters = false;
  Open("");
  EXPECT_FALSE(port_->Counters().lineErrors.areKnown);
}

TEST_F(PortOptionEffectsTest, EchoIsTakenOutAndCounted) {
  Open(",echo=strip");
  ASSERT_EQ(SetLine(kModeRs485), 1);
  ASSERT_EQ(Send("query"), 5);
  ASSERT_EQ(Sent(5), "query");
  ASSERT_TRUE(line_.Send("queryanswer", Deadline::After(kLimitMs)));
  EXPECT_EQ(Receive(6), "answer");
  ASSERT_EQ(Send("query"), 5);
  ASSERT_TRUE(line_.Send("quarrel", Deadline::After(kLimitMs)));
  EXPECT_EQ(Receive(5), "arrel");
  const PortCounters counters = port_->Counters();
  EXPECT_EQ(counters.echoBytes, 7U);
  EXPECT_EQ(counters.echoMismatches, 1U);
  EXPECT_EQ(counters.receivedBytes, 18U);
  EXPECT_EQ(counters.servedBytes, 11U);
  EXPECT_EQ(counters.sends, 2U);
  EXPECT_EQ(counters.sentBytes, 10U);
  EXPECT_EQ(counters.lostSends, 0U);
}

TEST_F(PortOptionEffectsTest, BytesAreSentOneByOneWithADelay) {
  constexpr int kDelayMs = 5;
  Open(",txdelay=" + std::to_string(kDelayMs));
  ASSERT_EQ(SetLine(kModeRs232), 1);
  const Deadline earliest = Deadline::After(2 * kDelayMs);
  EXPECT_EQ(Send("abc"), 3);
  EXPECT_TRUE(earliest.HasPassed());
  EXPECT_EQ(Sent(3), "abc");
}

}  // namespace
