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

  TokenFramer() = default;
  TokenFramer(const TokenFramer&) = delete;
  TokenFramer& operator=(const TokenFramer&) = delete;
  ~TokenFramer() = default;

  // Starts a pass with nothing received. `framing` stays owned by the caller, unchanged until the
  // next Begin.
  void Begin(const RxFraming& framing);

  // Takes one byte. Throws std::bad_alloc.
  Result OnByte(unsigned char byte) {
    if (end_ == stop_) {
      return OnByteAtStop(byte);
    }
    *end_++ = static_cast<char>(byte);
    // The last byte of what ends a token decides most of the time.
    return byte == endByte_ ? OnEndByte() : Result::kMore;
  }

  // Takes a silence, which ends the pass. True when it made a token.
  bool OnSilence();

  // The token that the last call made, without its framing. Valid until the next call of Begin,
  // OnByte or OnSilence.
  std::string_view Token() const { return token_; }

 private:
  static constexpr int kNoEndByte = -1;

  std::size_t GatheredBytes() const { return static_cast<std::size_t>(end_ - begin_); }
  const char* StorageEnd() const { return storage_.data() + storage_.size(); }

  Result OnByteAtStop(unsigned char byte);
  void MatchPrefix(unsigned char byte);
  void SetStop();
  void Append(unsigned char byte);
  void MakeRoom();
  Result OnEndByte();
  bool EndsWith(std::string_view mark) const;
  std::string_view Cut(std::size_t behindBytes) const;

  // Of the framing.
  std::string_view prefix_;
  std::string_view suffix_;
  int endByte_ = kNoEndByte;  // the last byte of what ends tokens: the suffix, or else the prefix

  std::size_t matched_ = 0;  // bytes of the prefix that have matched
  // Everything received and not dropped, framing included, is from begin_ to end_ in storage_. A
  // token that is followed by the next one's prefix stays in front of begin_. Where end_ meets
  // stop_, more is to be looked at than the byte: the prefix, the room, the most that may gather.
  std::vector<char> storage_;
  char* begin_ = nullptr;
  char* end_ = nullptr;
  char* stop_ = nullptr;
  std::string_view token_;
};
