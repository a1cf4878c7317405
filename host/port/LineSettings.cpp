// SPDX-License-Identifier: Apache-2.0
#include "host/port/LineSettings.h"

#include <termios.h>

#include <algorithm>
#include <array>

#include "host/port/PortOptions.h"
#include "interfaces/ISerialPort.h"

namespace {

struct Rate {
  int baudrate;
  speed_t code;
};

constexpr std::array<Rate, 11> kRates = {{{150, B150},
                                          {300, B300},
                                          {600, B600},
                                          {1200, B1200},
                                          {2400, B2400},
                                          {4800, B4800},
                                          {9600, B9600},
                                          {19200, B19200},
                                          {38400, B38400},
                                          {57600, B57600},
                                          {115200, B115200}}};

const Rate* FindRate(int baudrate) {
  const auto* const found = std::find_if(kRates.begin(), kRates.end(),
                                         [&](const Rate& r) { return r.baudrate == baudrate; });
  return found == kRates.end() ? nullptr : found;
}

tcflag_t ParityFlags(int parity) {
  switch (parity) {
    case kParityEven:
      return PARENB;
    case kParityOdd:
      return PARENB | PARODD;
    case kParityMark:
      return PARENB | PARODD | CMSPAR;
    case kParitySpace:
      return PARENB | CMSPAR;
    default:
      return 0;
  }
}

}  // namespace

std::string WhyInvalid(const LineSettings& settings) {
  if (FindRate(settings.baudrate) == nullptr) {
    return "baud rate " + std::to_string(settings.baudrate) +
           " is not one of 150, 300, 600, 1200, 2400, 4800, 9600, 19200, 38400, 57600, 115200";
  }
  if (settings.parity < kParityNone || settings.parity > kParitySpace) {
    return "parity code " + std::to_string(settings.parity) + " is not 0 to 4";
  }
  if (settings.dataBits != 7 && settings.dataBits != 8) {
    return std::to_string(settings.dataBits) + " data bits are not 7 or 8";
  }
  if (settings.stopBits != 1 && settings.stopBits != 2) {
    return std::to_string(settings.stopBits) + " stop bits are not 1 or 2";
  }
  if (settings.mode < kModeRs232 || settings.mode > kModeRs485P) {
    return "mode code " + std::to_string(settings.mode) + " is not 0 to 3";
  }
  return {};
}

void BuildRawMode(termios* line) {
  constexpr tcflag_t kInputOff = IGNBRK | BRKINT | IGNPAR | PARMRK | INPCK | ISTRIP | INLCR |
                                 IGNCR | ICRNL | IUCLC | IXON | IXANY | IXOFF | IMAXBEL;
  line->c_iflag &= ~kInputOff;
  line->c_oflag = 0;
  line->c_lflag = 0;
  line->c_cflag &= ~static_cast<tcflag_t>(CRTSCTS);
  line->c_cflag |= CLOCAL | CREAD;
  line->c_cc[VMIN] = 1;
  line->c_cc[VTIME] = 0;
}

bool BuildTermios(const LineSettings& settings, termios* line) {
  const Rate* const rate = FindRate(settings.baudrate);
  if (rate == nullptr || !WhyInvalid(settings).empty()) {
    return false;
  }
  BuildRawMode(line);
  line->c_cflag &= ~static_cast<tcflag_t>(CSIZE | CSTOPB | PARENB | PARODD | CMSPAR);
  line->c_cflag |= settings.dataBits == 7 ? CS7 : CS8;
  line->c_cflag |= settings.stopBits == 2 ? CSTOPB : 0U;
  line->c_cflag |= ParityFlags(settings.parity);
  return cfsetispeed(line, rate->code) == 0 && cfsetospeed(line, rate->code) == 0;
}

void AddLineOptions(const PortOptions& options, termios* line) {
  constexpr cc_t kXon = 0x11;
  constexpr cc_t kXoff = 0x13;
  if (options.flow == PortOptions::Flow::kRtsCts) {
    line->c_cflag |= CRTSCTS;
  } else if (options.flow == PortOptions::Flow::kXonXoff) {
    line->c_iflag |= IXON | IXOFF;
    line->c_cc[VSTART] = kXon;
    line->c_cc[VSTOP] = kXoff;
  }
  if (options.hupcl == PortOptions::Level::kOn) {
    line->c_cflag |= HUPCL;
  } else if (options.hupcl == PortOptions::Level::kOff) {
    line->c_cflag &= ~static_cast<tcflag_t>(HUPCL);
  }
}

std::string DescribeLine(const LineSettings& settings) {
  constexpr std::array<char, 5> kParityLetters = {'N', 'E', 'O', 'M', 'S'};
  constexpr std::array<const char*, 4> kModeNames = {"RS-232", "RS-485", "RS-422", "RS-485P"};
  const auto parity = static_cast<std::size_t>(settings.parity);
  const auto mode = static_cast<std::size_t>(settings.mode);
  return std::to_string(settings.baudrate) + " " + std::to_string(settings.dataBits) +
         (parity < kParityLetters.size() ? kParityLetters[parity] : '?') +
         std::to_string(settings.stopBits) + " " +
         (mode < kModeNames.size() ? kModeNames[mode] : "mode ?");
}

long long LineTimeMs(const LineSettings& settings, long long lengthBytes) {
  const long long bitsPerByte =
      1LL + settings.dataBits + (settings.parity == kParityNone ? 0 : 1) + settings.stopBits;
  const long long baudrate = std::max(settings.baudrate, 1);
  return (lengthBytes * bitsPerByte * 1000 + baudrate - 1) / baudrate;
}
