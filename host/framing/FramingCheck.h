// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <deque>
#include <string>
#include <string_view>

#include "host/framing/ByteLabeller.h"

// A token as a reader took it from the driver's queue.
struct DriverToken {
  std::string bytes;
  std::size_t lengthBytes = 0;  // the true length
  bool isCut = false;           // `bytes` ends in front of the token's first zero byte
};

// The driver's token and the one that the framing rules give differ.
struct FramingFinding {
  enum class Kind {
    kDifferent,  // both are there and differ
    kMissing,    // the driver did not queue it
    kExtra,      // the driver has a token where the rules give none
  };

  Kind kind = Kind::kDifferent;
  std::string driverBytes;   // empty for kMissing
  std::string modelBytes;    // empty for kExtra
  std::uint64_t offset = 0;  // of the model's frame on the line; 0 for kExtra
  std::string text;          // one sentence for people
};

// Takes what a FramingCheck and its labeller find out.
class CheckSink : public LabelSink {
 public:
  virtual void OnFinding(const FramingFinding& finding) = 0;
  // A whole token that a full queue dropped. Its bytes were told as body before.
  virtual void OnQueueFull(const CutToken& token) = 0;
};

// Holds the driver's tokens against those that ByteLabeller cuts from the bytes that the port gave
// to the driver.
//
// The line side (OnBytes, OnSilence, OnDisconnected) comes in the order in which the port answered,
// and each silence before the driver learns of it. The reader side (OnDriverToken, OnEmptyQueue)
// comes in the order of the reader's calls. Tokens of either side wait for the other one; whether
// they differ is decided at the next silence, when all bytes in front of it are known. One thread
// at a time: the owner has a lock around both sides.
//
// After a finding, changed settings, a cleared queue or a closed port the sides are not comparable
// for a while. The comparison starts again behind the next silence, with the first token of the
// driver that is an expected one. A difference is therefore told once.
class FramingCheck final : private LabelSink {
 public:
  // The sink must outlive the check.
  FramingCheck(const FramingSettings& settings, CheckSink* sink);

  // The line side; see ByteLabeller.
  void OnBytes(std::string_view bytes);
  void OnSilence(int waitedMs);
  void OnDisconnected();

  // A token that was read and acknowledged.
  void OnDriverToken(const DriverToken& token);

  // The reader asked how many tokens wait and was told none.
  void OnEmptyQueue();

  // To be called before anything changes the settings or takes tokens unread (SP_Done, the
  // console).
  void Interrupt();

  // The settings that the driver runs with from now on.
  void ChangeSettings(const FramingSettings& settings);

  // True while tokens are compared one by one.
  bool IsComparing() const { return state_ == State::kComparing; }

  std::uint64_t ComparedTokens() const { return comparedTokens_; }
  std::uint64_t Findings() const { return findings_; }

 private:
  enum class State {
    kUnsure,     // until the next silence: settings or queue of the driver are not known exactly
    kSearching,  // for a token of the driver that is an expected one
    kComparing,
  };

  void OnLabelled(const LabelledBytes& labelled) override;
  void OnCutToken(const CutToken& token) override;

  void CompareWhatIsThere();
  bool Search();
  void StartComparing(std::size_t takenIndex, std::size_t expectedIndex);
  void DecideAtSilence();
  void DecideFront();
  bool IsMatch(std::size_t takenIndex, std::size_t expectedIndex) const;
  std::size_t FindExpected(std::size_t takenIndex) const;
  bool IsRepeatOfFound() const;
  bool MayHaveOverflowed() const;
  void LoseFront(std::size_t count);
  void PopExpected();
  void LimitBacklog();
  void Report(FramingFinding::Kind kind, const std::string& text);

  CheckSink* const sink_;
  ByteLabeller labeller_;
  std::size_t queueTokens_;
  State state_ = State::kComparing;

  std::deque<CutToken> expected_;
  std::size_t queued_ = 0;        // of them, from the front: certainly in the driver's queue
  std::size_t foundMissing_ = 0;  // of those: the queue was empty afterwards
  std::deque<DriverToken> taken_;

  std::string found_;              // what ended the search
  bool isFoundLast_ = false;       // and nothing else has been compared since
  std::size_t cutsSinceEven_ = 0;  // tokens cut since both sides were known to be even

  std::uint64_t comparedTokens_ = 0;
  std::uint64_t findings_ = 0;
};
