// SPDX-License-Identifier: Apache-2.0
#include "host/sim/GaugeDevice.h"

#include <array>
#include <cstdio>

namespace {

constexpr std::uint64_t kGaugeStream = 0x6A06E;
constexpr int kMeanUm = 12345;
constexpr int kSpreadUm = 10;

}  // namespace

GaugeDevice::GaugeDevice(const DeviceSettings& settings)
    : CommandDevice(settings), random_(settings.seed, kGaugeStream) {}

std::string GaugeDevice::NextBody() {
  const int um = kMeanUm - kSpreadUm + static_cast<int>(random_.Below(2 * kSpreadUm + 1));
  std::array<char, 32> text{};
  (void)std::snprintf(text.data(), text.size(), "+%d.%03d mm", um / 1000, um % 1000);
  return text.data();
}

std::string GaugeDevice::Obey(const std::string& command, DeviceAnswer* answer) {
  if (command != "M?" && command != "?") {
    return {};
  }
  AnswerWithNext("value", answer);
  return "value request";
}
