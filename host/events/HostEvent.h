// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>
#include <variant>

// What can happen around one port, as the host tells it. Text lines, NDJSON, the hex dump, the log
// and the counters are all made from these and from nothing else.

// Bytes that the driver took from the line.
struct BytesReceived {
  std::string bytes;
};

// Bytes that went out; fewer than given when the line is lost or does not take them.
struct BytesSent {
  std::string bytes;
  std::uint64_t takenBytes = 0;
};

// A token that the driver put into its queue and that is the oldest one now.
struct TokenReceived {
  std::uint64_t number = 0;  // counts from 1 since the instance was started
  std::string bytes;         // without what stands behind a zero byte when isCut
  unsigned int lengthBytes = 0;
  unsigned int waiting = 0;      // tokens in the queue, this one included
  std::int64_t durationUs = -1;  // from the frame's first to its last byte; -1 not known
  bool isCut = false;
  std::string frame;  // as it came on the line, prefix and suffix included; empty when not known
  std::uint64_t prefixBytes = 0;  // of the frame
  std::uint64_t suffixBytes = 0;
};

// Bytes of a token, and what they are in its frame.
struct BytesLabelled {
  std::string role;  // "prefix", "body", "suffix"
  std::string bytes;
};

// Bytes that did not become part of a token.
struct BytesDropped {
  std::string reason;  // "no-suffix" and the like, as ByteLabeller names them
  std::string bytes;
  int afterMs = 0;  // the silence that ended them; 0 when none did
};

// The port was opened, lost, came back or was closed.
struct PortChanged {
  std::string state;      // "open", "lost", "back", "closed"
  std::string errorName;  // "EIO"; empty when there is none
  std::string text;       // why, for people
};

// A run-time setting was staged, applied or stored.
struct SettingChanged {
  std::string state;  // "staged", "applied", "stored"
  std::string key;    // "baud"
  std::string value;
  std::string previous;  // the value in effect before; empty when not known
};

// A console command and what the driver answered.
struct ConsoleReplied {
  std::string command;
  bool isDone = false;
  std::string reply;
};

// Something the user should know.
struct NoteMade {
  std::string text;
  std::uint64_t missedBytes = 0;  // that the driver had and nobody else: they came too fast
};

// The driver's token and the host's own reading of the same bytes differ.
struct FindingMade {
  std::string text;
  std::string driverBytes;
  std::string modelBytes;
};

struct HostEvent {
  using Detail = std::variant<BytesReceived, BytesSent, BytesLabelled, TokenReceived, BytesDropped,
                              PortChanged, SettingChanged, ConsoleReplied, NoteMade, FindingMade>;

  std::int64_t timeUs = 0;  // microseconds since 1970-01-01 UTC
  std::string port;         // the name in the configuration, "com1"
  Detail detail;
};
