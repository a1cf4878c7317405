// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

#include "host/sim/DeviceMessage.h"
#include "host/sim/FaultOptions.h"
#include "host/sim/SimRandom.h"
#include "host/sim/TimedChunk.h"

// Turns a message into timed bytes and makes the faults. The outcome depends on the options, the
// seed, the number and the message only, not on time or on earlier messages. Any thread.
//
// Names of the faults: "too-long", "drop-prefix", "drop-suffix", "noise", "flip", "split".
class FaultMaker {
 public:
  static constexpr int kBitsPerByte = 10;

  FaultMaker(const FaultOptions& options, std::uint64_t seed) : options_(options), seed_(seed) {}

  WireMessage Make(std::uint64_t number, const DeviceMessage& message) const;

 private:
  std::string FramedBytes(const DeviceMessage& message, SimRandom* random,
                          std::vector<std::string>* faults) const;
  void AddNoise(std::string* bytes, SimRandom* random, std::vector<std::string>* faults) const;
  void FlipBits(std::string* bytes, SimRandom* random, std::vector<std::string>* faults) const;
  std::vector<std::string> Cut(const std::string& bytes, SimRandom* random) const;
  void Time(const std::vector<std::string>& pieces, WireMessage* wire) const;

  const FaultOptions options_;
  const std::uint64_t seed_;
};
