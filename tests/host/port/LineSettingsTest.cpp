// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <linux/serial.h>
#include <termios.h>

#include <cstring>
#include <map>

#include "host/port/LineSettings.h"
#include "host/port/LinuxRs485.h"
#include "host/port/PseudoTerminal.h"
#include "host/port/TerminalCalls.h"
#include "interfaces/ISerialPort.h"

namespace {

constexpr tcflag_t kFormatFlags = CSIZE | CSTOPB | PARENB | PARODD | CMSPAR;

// Everything on, so that whatever must be off has to be switched off.
termios AllOn() {
  termios line{};
  std::memset(&line, 0xFF, sizeof line);
  return line;
}

tcflag_t FormatOf(const LineSettings& settings) {
  termios line = AllOn();
  EXPECT_TRUE(BuildTermios(settings, &line));
  return line.c_cflag & kFormatFlags;
}

TEST(LineSettings, SetsEachOfTheElevenRates) {
  const std::map<int, speed_t> rates = {{150, B150},     {300, B300},      {600, B600},
                                        {1200, B1200},   {2400, B2400},    {4800, B4800},
                                        {9600, B9600},   {19200, B19200},  {38400, B38400},
                                        {57600, B57600}, {115200, B115200}};
  for (const auto& [baudrate, code] : rates) {
    for (termios line : {termios{}, AllOn()}) {
      ASSERT_TRUE(BuildTermios({baudrate, 0, 8, 1, 0}, &line)) << baudrate;
      EXPECT_EQ(cfgetispeed(&line), code);
      EXPECT_EQ(cfgetospeed(&line), code);
    }
  }
}

TEST(LineSettings, SetsParity) {
  EXPECT_EQ(FormatOf({9600, kParityNone, 8, 1, 0}), CS8);
  EXPECT_EQ(FormatOf({9600, kParityEven, 8, 1, 0}), CS8 | PARENB);
  EXPECT_EQ(FormatOf({9600, kParityOdd, 8, 1, 0}), CS8 | PARENB | PARODD);
  EXPECT_EQ(FormatOf({9600, kParityMark, 8, 1, 0}), CS8 | PARENB | PARODD | CMSPAR);
  EXPECT_EQ(FormatOf({9600, kParitySpace, 8, 1, 0}), CS8 | PARENB | CMSPAR);
}

TEST(LineSettings, SetsDataAndStopBits) {
  EXPECT_EQ(FormatOf({9600, 0, 7, 1, 0}), static_cast<tcflag_t>(CS7));
  EXPECT_EQ(FormatOf({9600, 0, 8, 1, 0}), static_cast<tcflag_t>(CS8));
  EXPECT_EQ(FormatOf({9600, 0, 7, 2, 0}), static_cast<tcflag_t>(CS7 | CSTOPB));
  EXPECT_EQ(FormatOf({9600, 0, 8, 2, 0}), static_cast<tcflag_t>(CS8 | CSTOPB));
}

TEST(LineSettings, IsRawWhateverWasSetBefore) {
  termios line = AllOn();
  ASSERT_TRUE(BuildTermios({9600, 0, 8, 1, 0}, &line));
  EXPECT_EQ(line.c_iflag & (IGNBRK | BRKINT | PARMRK | INPCK | ISTRIP | INLCR | IGNCR | ICRNL |
                            IGNPAR | IXON | IXANY | IXOFF),
            0U);
  EXPECT_EQ(line.c_oflag, 0U);
  EXPECT_EQ(line.c_lflag, 0U);
  EXPECT_EQ(line.c_cflag & CRTSCTS, 0U);
  EXPECT_EQ(line.c_cflag & (CLOCAL | CREAD), static_cast<tcflag_t>(CLOCAL | CREAD));
  EXPECT_EQ(line.c_cc[VMIN], 1);
  EXPECT_EQ(line.c_cc[VTIME], 0);
}

TEST(LineSettings, LeavesTheTreatmentOfDtrAlone) {
  termios on = AllOn();
  termios off{};
  ASSERT_TRUE(BuildTermios({9600, 0, 8, 1, 0}, &on));
  ASSERT_TRUE(BuildTermios({9600, 0, 8, 1, 0}, &off));
  EXPECT_NE(on.c_cflag & HUPCL, 0U);
  EXPECT_EQ(off.c_cflag & HUPCL, 0U);
}

TEST(LineSettings, RefusesOtherNumbersAndTouchesNothing) {
  const LineSettings bad[] = {{0, 0, 8, 1, 0},      {115000, 0, 8, 1, 0}, {-9600, 0, 8, 1, 0},
                              {230400, 0, 8, 1, 0}, {9600, -1, 8, 1, 0},  {9600, 5, 8, 1, 0},
                              {9600, 0, 6, 1, 0},   {9600, 0, 9, 1, 0},   {9600, 0, 8, 0, 0},
                              {9600, 0, 8, 3, 0},   {9600, 0, 8, 1, -1},  {9600, 0, 8, 1, 4}};
  for (const LineSettings& settings : bad) {
    termios line = AllOn();
    const termios before = line;
    EXPECT_NE(WhyInvalid(settings), "");
    EXPECT_FALSE(BuildTermios(settings, &line));
    EXPECT_EQ(std::memcmp(&line, &before, sizeof line), 0);
  }
}

TEST(LineSettings, ExplainsABadRateWithTheGoodOnes) {
  EXPECT_EQ(WhyInvalid({115000, 0, 8, 1, 0}),
            "baud rate 115000 is not one of 150, 300, 600, 1200, 2400, 4800, 9600, 19200, 38400, "
            "57600, 115200");
  EXPECT_EQ(WhyInvalid({115200, 0, 8, 1, 0}), "");
}

TEST(LineSettings, DescribesALine) {
  EXPECT_EQ(DescribeLine({9600, kParityEven, 7, 1, kModeRs232}), "9600 7E1 RS-232");
  EXPECT_EQ(DescribeLine({150, kParityNone, 8, 2, kModeRs485}), "150 8N2 RS-485");
  EXPECT_EQ(DescribeLine({150, kParityMark, 8, 2, kModeRs422}), "150 8M2 RS-422");
  EXPECT_EQ(DescribeLine({150, kParitySpace, 8, 2, kModeRs485P}), "150 8S2 RS-485P");
  EXPECT_EQ(DescribeLine({150, kParityOdd, 8, 2, 9}), "150 8O2 mode ?");
  EXPECT_EQ(DescribeLine({150, -1, 8, 2, -1}), "150 8?2 mode ?");
}

TEST(LineSettings, KnowsHowLongBytesTake) {
  EXPECT_EQ(LineTimeMs({9600, kParityNone, 8, 1, 0}, 960), 1000);
  EXPECT_EQ(LineTimeMs({9600, kParityEven, 8, 1, 0}, 960), 1100);
  EXPECT_EQ(LineTimeMs({150, kParityEven, 7, 2, 0}, 1), 74);
  EXPECT_EQ(LineTimeMs({115200, kParityNone, 8, 1, 0}, 0), 0);
}

TEST(LinuxRs485, SwitchesTheDirectionByRtsForTwoWireModes) {
  for (const int mode : {static_cast<int>(kModeRs485), static_cast<int>(kModeRs485P)}) {
    serial_rs485 settings{};
    std::memset(&settings, 0xFF, sizeof settings);
    BuildRs485Settings(mode, &settings);
    EXPECT_EQ(settings.flags, static_cast<unsigned>(SER_RS485_ENABLED | SER_RS485_RTS_ON_SEND));
    EXPECT_EQ(settings.delay_rts_before_send, 0U);
    EXPECT_EQ(settings.delay_rts_after_send, 0U);
  }
}

TEST(LinuxRs485, IsOffForTheOtherModes) {
  for (const int mode : {static_cast<int>(kModeRs232), static_cast<int>(kModeRs422)}) {
    serial_rs485 settings{};
    std::memset(&settings, 0xFF, sizeof settings);
    BuildRs485Settings(mode, &settings);
    EXPECT_EQ(settings.flags, 0U);
  }
}

TEST(LinuxRs485, TellsWhenADeviceHasNoSuchControl) {
  const PseudoTerminal line;
  EXPECT_EQ(ApplyRs485(TerminalCalls::System(), line.FileDescriptor(), kModeRs232),
            Rs485Outcome::kDone);
  EXPECT_EQ(ApplyRs485(TerminalCalls::System(), line.FileDescriptor(), kModeRs422),
            Rs485Outcome::kDone);
  EXPECT_EQ(ApplyRs485(TerminalCalls::System(), line.FileDescriptor(), kModeRs485),
            Rs485Outcome::kNotSupported);
  EXPECT_EQ(ApplyRs485(TerminalCalls::System(), -1, kModeRs485), Rs485Outcome::kFailed);
}

}  // namespace
