// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/sim/DeviceMessage.h"
#include "host/sim/TimedChunk.h"

// All bytes of a message on the wire, in order.
inline std::string Bytes(const WireMessage& wire) {
  std::string bytes;
  for (const TimedChunk& chunk : wire.chunks) {
    bytes += chunk.bytes;
  }
  return bytes;
}

// A message between STX and ETX.
inline DeviceMessage StxEtx(const std::string& body) {
  return {"text", {"\x02", "\x03"}, body, false};
}
