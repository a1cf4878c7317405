// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

// What a received byte stream is cut by; empty texts are not used.
struct RxFraming {
  std::string prefix;
  std::string suffix;
};

// Cuts one pass of received bytes into tokens:
//   prefix and suffix  the bytes between them; silence drops a partial token
//   prefix only        the bytes from one prefix to the next, or to a silence
//   suffix only        the bytes up to the suffix; silence drops a partial token
//   neither            the bytes up to a silence
// Does no input or output. One thread; the memory of one pass serves the next.
class TokenFramer {
 public:
  // What has become of a byte.
  enum class Result {
    kMore,          // go on receiving
    kToken,         // a token is complete, the pass ends
    kTokenAndMore,  // a token is complete, the next one has begun
    kDropped,       // too many bytes without an end: dropped, the pass ends
  };

  // The most bytes, framing included, that may gather without making a token.
  static constexpr std::size_t kMaxGatheredBytes = 1000;

  // Starts a pass with nothing received. `framing` stays owned by the caller, unchanged until the
  // next Begin.
  void Begin(const RxFraming& framing);

  // Takes one byte. Throws std::bad_alloc.
  Result OnByte(unsigned char byte) {
    if (matched_ < prefix_.size()) {
      MatchPrefix(byte);
      return Result::kMore;
    }
    Append(byte);
    // The last byte of what ends a token decides most of the time.
    if (byte == endByte_ && hasEnd_) {
      return OnEndByte();
    }
    return GatheredBytes() > kMaxGatheredBytes ? Result::kDropped : Result::kMore;
  }

  // Takes a silence, which ends the pass. True when it made a token.
  bool OnSilence();

  // The token that the last call made, without its framing. Valid until the next call of Begin,
  // OnByte or OnSilence.
  std::string_view Token() const { return token_; }

 private:
  void Append(unsigned char byte) {
    if (end_ == storage_.size()) {
      MakeRoom();
    }
    storage_[end_++] = static_cast<char>(byte);
  }
  std::size_t GatheredBytes() const { return end_ - begin_; }

  void MakeRoom();
  void MatchPrefix(unsigned char byte);
  Result OnEndByte();
  bool EndsWith(std::string_view mark) const;
  std::string_view Cut(std::size_t behindBytes) const;

  // Of the framing.
  std::string_view prefix_;
  std::string_view suffix_;
  bool hasEnd_ = false;  // a suffix, or else a prefix, ends tokens; this is its last byte
  unsigned char endByte_ = 0;

  std::size_t matched_ = 0;  // bytes of the prefix that have matched
  // Everything received and not dropped, framing included, is storage_ from begin_ to end_. A token
  // that is followed by the next one's prefix stays in front of begin_.
  std::vector<char> storage_;
  std::size_t begin_ = 0;
  std::size_t end_ = 0;
  std::string_view token_;
};
