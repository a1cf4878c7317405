// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

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
  Result OnByte(unsigned char byte);

  // Takes a silence, which ends the pass. True when it made a token.
  bool OnSilence();

  // The token that the last call made, without its framing. Valid until the next call of Begin,
  // OnByte or OnSilence.
  std::string_view Token() const { return token_; }

 private:
  void MatchPrefix(char byte);
  Result OnBodyByte(char byte);
  bool EndsWith(const std::string& mark) const;
  std::string_view Cut(std::size_t behindBytes) const;

  const RxFraming* framing_ = nullptr;
  std::string gathered_;          // everything received and not dropped, framing included
  std::size_t matched_ = 0;       // bytes of the prefix that have matched
  std::size_t count_ = 0;         // bytes received since the pass began, prefix included
  bool restartAtPrefix_ = false;  // the last byte completed the next token's prefix
  std::string_view token_;
};
