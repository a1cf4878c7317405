// SPDX-License-Identifier: Apache-2.0
#include "host/sim/RfidDevice.h"

#include "host/sim/SimRandom.h"
#include "host/text/ByteText.h"

namespace {

constexpr std::uint64_t kRfidStream = 0xCA4D;
constexpr std::size_t kNumberBytes = 5;
constexpr std::array<std::size_t, 6> kOrder = {0, 0, 1, 2, 3, 1};

std::string MakeCard(SimRandom* random) {
  std::string card;
  unsigned int check = 0;
  for (std::size_t i = 0; i < kNumberBytes; ++i) {
    const auto byte = static_cast<unsigned char>(random->Below(256));
    card += static_cast<char>(byte);
    check ^= byte;
  }
  card += static_cast<char>(static_cast<unsigned char>(check));
  return card;
}

}  // namespace

RfidDevice::RfidDevice(const DeviceSettings& settings) : CommandDevice(settings) {
  SimRandom random(settings.seed, kRfidStream);
  for (std::string& card : cards_) {
    card = MakeCard(&random);
  }
}

std::string RfidDevice::NextBody() {
  const std::string& card = cards_[kOrder[next_++ % kOrder.size()]];
  return Settings().isBinary ? card : CompactHex(card);
}

std::string RfidDevice::Obey(const std::string& /*command*/, DeviceAnswer* /*answer*/) {
  return {};
}
