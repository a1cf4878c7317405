// SPDX-License-Identifier: Apache-2.0
#include "host/sim/FaultMaker.h"

#include <algorithm>
#include <set>

namespace {

std::string Lengthened(const std::string& body, std::size_t lengthBytes) {
  const std::string pattern = body.empty() ? "X" : body;
  std::string result;
  while (result.size() < lengthBytes) {
    result += pattern;
  }
  result.resize(lengthBytes);
  return result;
}

}  // namespace

WireMessage FaultMaker::Make(std::uint64_t number, const DeviceMessage& message) const {
  WireMessage wire;
  if (message.isVerbatim) {
    Time({message.body}, &wire);
    return wire;
  }
  SimRandom random(seed_, number);
  std::string bytes = FramedBytes(message, &random, &wire.faults);
  AddNoise(&bytes, &random, &wire.faults);
  FlipBits(&bytes, &random, &wire.faults);
  const std::vector<std::string> pieces = Cut(bytes, &random);
  if (pieces.size() > 1) {
    wire.faults.emplace_back("split");
  }
  Time(pieces, &wire);
  return wire;
}

// Each chance is drawn whether it counts or not, so that one option does not move the faults of
// another.
std::string FaultMaker::FramedBytes(const DeviceMessage& message, SimRandom* random,
                                    std::vector<std::string>* faults) const {
  const bool isTooLong = random->Chance(options_.tooLongPercent) && options_.tooLongBytes > 0;
  const bool isWithoutPrefix =
      random->Chance(options_.dropPrefixPercent) && !message.framing.prefix.empty();
  const bool isWithoutSuffix =
      random->Chance(options_.dropSuffixPercent) && !message.framing.suffix.empty();
  std::string bytes = isWithoutPrefix ? "" : message.framing.prefix;
  bytes += isTooLong ? Lengthened(message.body, options_.tooLongBytes) : message.body;
  bytes += isWithoutSuffix ? "" : message.framing.suffix;
  if (isTooLong) {
    faults->emplace_back("too-long");
  }
  if (isWithoutPrefix) {
    faults->emplace_back("drop-prefix");
  }
  if (isWithoutSuffix) {
    faults->emplace_back("drop-suffix");
  }
  return bytes;
}

void FaultMaker::AddNoise(std::string* bytes, SimRandom* random,
                          std::vector<std::string>* faults) const {
  if (options_.noisePercent <= 0) {
    return;
  }
  std::string noisy;
  for (const char byte : *bytes) {
    if (random->Chance(options_.noisePercent)) {
      noisy += static_cast<char>(static_cast<unsigned char>(random->Below(256)));
    }
    noisy += byte;
  }
  if (noisy.size() != bytes->size()) {
    *bytes = noisy;
    faults->emplace_back("noise");
  }
}

void FaultMaker::FlipBits(std::string* bytes, SimRandom* random,
                          std::vector<std::string>* faults) const {
  if (options_.flipPercent <= 0) {
    return;
  }
  bool isFlipped = false;
  for (char& byte : *bytes) {
    if (random->Chance(options_.flipPercent)) {
      const unsigned int bit = 1U << random->Below(8);
      byte = static_cast<char>(static_cast<unsigned char>(byte) ^ bit);
      isFlipped = true;
    }
  }
  if (isFlipped) {
    faults->emplace_back("flip");
  }
}

// Cuts at different places; a message of n bytes has n pieces at most.
std::vector<std::string> FaultMaker::Cut(const std::string& bytes, SimRandom* random) const {
  std::set<std::size_t> cuts;
  const std::size_t places = bytes.empty() ? 0 : bytes.size() - 1;
  while (cuts.size() < std::min(options_.pieces - 1, places)) {
    cuts.insert(1 + static_cast<std::size_t>(random->Below(places)));
  }
  cuts.insert(bytes.size());
  std::vector<std::string> pieces;
  std::size_t begin = 0;
  for (const std::size_t end : cuts) {
    pieces.push_back(bytes.substr(begin, end - begin));
    begin = end;
  }
  return pieces;
}

void FaultMaker::Time(const std::vector<std::string>& pieces, WireMessage* wire) const {
  constexpr std::int64_t kNsPerSecond = 1000000000;
  const std::chrono::nanoseconds byteTime(
      options_.baud > 0 ? kNsPerSecond * kBitsPerByte / options_.baud : 0);
  bool isBehindPause = false;
  for (const std::string& piece : pieces) {
    if (isBehindPause) {
      wire->length += std::chrono::milliseconds(options_.pauseMs);
    }
    if (options_.baud <= 0) {
      wire->chunks.push_back({wire->length, piece, isBehindPause});
    } else {
      for (const char byte : piece) {
        // A byte is there when its last bit has come.
        wire->length += byteTime;
        wire->chunks.push_back({wire->length, std::string(1, byte), isBehindPause});
        isBehindPause = false;
      }
    }
    isBehindPause = true;
  }
}
