// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

// What a received byte turned out to be.
enum class ByteRole { kPrefix, kBody, kSuffix, kDropped };

// Why a byte did not become part of a token, or a token did not reach its reader.
enum class DropReason {
  kNone,
  kNoPrefix,       // no frame is open and the byte is not the first one of the prefix
  kPrefixRestart,  // the prefix had begun, then another byte came
  kPartialPrefix,  // silence in the middle of the prefix
  kNoBody,         // silence behind a prefix that stands alone, where no suffix is set
  kNoSuffix,       // silence in front of the suffix
  kOver1000,       // the frame, its prefix included, grew past 1000 bytes
  kDisconnected,   // the port was closed in the middle of a frame
  kQueueFull,      // a whole token that made room for a newer one
};

// Bytes in a row that have the same role.
struct LabelledBytes {
  std::uint64_t offset = 0;  // of the first one, counted from the labeller's first byte
  std::string bytes;
  ByteRole role = ByteRole::kDropped;
  DropReason reason = DropReason::kNone;
  int afterMs = 0;  // the silence that decided it; 0 when none did
};

// A token as the framing rules cut it.
struct CutToken {
  std::uint64_t offset = 0;     // of the frame's first byte
  std::uint64_t endOffset = 0;  // behind the last byte that was needed to cut it
  std::string bytes;            // without prefix and suffix
};

// "prefix", "body", "suffix", "dropped". Any thread.
const char* NameOf(ByteRole role);

// As in events: "no-suffix", "over-1000". Empty for kNone. Any thread.
const char* NameOf(DropReason reason);

// The reason in words that a technician knows, with what helps; empty for kNone. Any thread.
const char* HintFor(DropReason reason);
