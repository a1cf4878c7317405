// SPDX-License-Identifier: Apache-2.0
#include "host/sim/ScaleDevice.h"

#include <array>
#include <cstdint>
#include <cstdio>
#include <cstdlib>

namespace {

constexpr std::uint64_t kScaleStream = 0x5CA1E;
constexpr int kMaxLoadGrams = 150000;

}  // namespace

ScaleDevice::ScaleDevice(const DeviceSettings& settings)
    : CommandDevice(settings), random_(settings.seed, kScaleStream) {}

std::string ScaleDevice::NextBody() {
  const int drift = Settings().driftGrams;
  if (drift > 0) {
    const auto choices = static_cast<std::uint64_t>(drift) * 2 + 1;
    const int step = static_cast<int>(random_.Below(choices)) - drift;
    isMoving_ = std::abs(step) * 2 > drift;
    // The load never leaves the pan and never breaks it.
    if (loadGrams_ + step >= 0 && loadGrams_ + step <= kMaxLoadGrams) {
      loadGrams_ += step;
    }
  }
  return Display();
}

std::string ScaleDevice::Display() const {
  const int grams = loadGrams_ - zeroGrams_ - tareGrams_;
  // Rounded to 10 g, the scale's division.
  const int hundredths = (std::abs(grams) + 5) / 10;
  std::array<char, 48> text{};
  (void)std::snprintf(text.data(), text.size(), "%s,%s%c%3d.%02dkg", isMoving_ ? "US" : "ST",
                      tareGrams_ == 0 ? "GS" : "NT", grams < 0 ? '-' : '+', hundredths / 100,
                      hundredths % 100);
  return text.data();
}

std::string ScaleDevice::Obey(const std::string& command, DeviceAnswer* answer) {
  if (command == "R" || command == "SI") {
    // Asking does not move the load.
    if (Settings().texts.empty()) {
      answer->replies.push_back(Framed("weight", Display()));
    } else {
      AnswerWithNext("weight", answer);
    }
    return "weight request";
  }
  if (command == "Z") {
    zeroGrams_ = loadGrams_;
    tareGrams_ = 0;
  } else if (command == "T") {
    tareGrams_ = loadGrams_ - zeroGrams_;
  } else {
    return {};
  }
  answer->replies.push_back(Framed("reply", "OK"));
  return command == "Z" ? "zero" : "tare";
}
