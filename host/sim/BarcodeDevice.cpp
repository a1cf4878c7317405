// SPDX-License-Identifier: Apache-2.0
#include "host/sim/BarcodeDevice.h"

#include <array>

namespace {

// Numbers for use inside a shop (they begin with 2) with right check digits, so that nobody's goods
// are meant. The fourth one is a GS1 code: article, date, lot, GS, serial number.
constexpr std::array<const char*, 6> kCodes = {"2012345678903",
                                               "2012345678903",
                                               "20123451",
                                               "]d201020123456789031726123110LOT7\x1D"
                                               "21SER42",
                                               "ABC-1234",
                                               "2012345678903"};

}  // namespace

std::string BarcodeDevice::NextBody() { return kCodes[next_++ % kCodes.size()]; }

std::string BarcodeDevice::Obey(const std::string& command, DeviceAnswer* answer) {
  if (command != "T") {
    return {};
  }
  AnswerWithNext("code", answer);
  return "trigger";
}
