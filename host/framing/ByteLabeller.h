// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "host/framing/ByteRole.h"
#include "host/framing/FramingSettings.h"

// Takes what a ByteLabeller has decided. Called from inside the labeller's operations.
class LabelSink {
 public:
  virtual ~LabelSink() = default;
  // Every byte comes exactly once, in the order of the line.
  virtual void OnLabelled(const LabelledBytes& labelled) = 0;
  // Behind the labels of the token's bytes.
  virtual void OnCutToken(const CutToken& token) = 0;
};

// The host's own reading of the framing rules: says of every byte that the port gave to the driver
// what it is (prefix, body, suffix or dropped, and why), and which tokens must come of it.
//
// It keeps the bytes whose role is still open in a window that starts with what may be a frame, and
// looks at the whole window each time. A role is told as soon as nothing can change it any more,
// which is often late: a prefix is one only once its token is whole. At most about 1000 bytes are
// open at a time; a silence decides all of them.
//
// Settings are those of a receive pass. A pass ends with a token (unless only a prefix is set), a
// silence, a frame that is too long or a closed port; changed settings hold from the next pass on.
//
// One thread at a time. Feed it in the order in which the port answered.
class ByteLabeller {
 public:
  // Longest frame that is kept, prefix and suffix included, in bytes.
  static constexpr std::size_t kMaxFrameBytes = 1000;

  // The sink must outlive the labeller.
  ByteLabeller(FramingSettings settings, LabelSink* sink);

  // Bytes that the port handed out.
  void OnBytes(std::string_view bytes);

  // The port answered "nothing came" after waiting `waitedMs`.
  void OnSilence(int waitedMs);

  // The port was closed: what is open is dropped.
  void OnDisconnected();

  // Settings for the passes that follow; at once while the port has not been asked yet.
  void ChangeSettings(const FramingSettings& settings);

  // What the pass in progress works with.
  const FramingSettings& Settings() const { return current_; }

  // Bytes without a role so far.
  std::size_t OpenBytes() const { return window_.size() - told_ + strays_.size(); }

 private:
  void BeginPass();
  void Decide();
  void BreakOffPrefix();
  void DecideBody();
  void CutAtSuffix();
  void CutAtNextPrefix();
  void CutAtSilence(int waitedMs);
  void DropWindow(DropReason reason, int afterMs);
  void AddStray(char byte);
  void TellStrays();
  void Tell(std::size_t from, std::size_t to, ByteRole role, DropReason reason = DropReason::kNone,
            int afterMs = 0);
  void TellToken(std::size_t bodyEnd);
  void RemoveFromWindow(std::size_t count);
  bool EndsWith(const std::string& tail) const;

  LabelSink* const sink_;
  FramingSettings current_;
  FramingSettings next_;
  bool isAsked_ = false;  // the port has answered since it was opened

  std::string window_;              // what may be a frame, from its first byte on
  std::uint64_t windowOffset_ = 0;  // of the window's first byte
  std::size_t told_ = 0;            // bytes at the window's start that were told with another frame
  std::string strays_;              // bytes outside frames that wait to be told in one piece
};
