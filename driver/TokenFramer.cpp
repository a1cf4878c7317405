// SPDX-License-Identifier: Apache-2.0
#include "driver/TokenFramer.h"

#include <algorithm>
#include <cstring>

namespace {

constexpr std::size_t kStorageBytesAtFirst = 2048;  // more than a frame may have

}  // namespace

void TokenFramer::Begin(const RxFraming& framing) {
  prefix_ = framing.prefix;
  suffix_ = framing.suffix;
  const std::string_view mark = suffix_.empty() ? prefix_ : suffix_;
  hasEnd_ = !mark.empty();
  endByte_ = hasEnd_ ? static_cast<unsigned char>(mark.back()) : 0;
  matched_ = 0;
  begin_ = 0;
  end_ = 0;
  token_ = {};
}

// Moves what is gathered to the front, into more memory when that alone makes no room.
void TokenFramer::MakeRoom() {
  const std::size_t gathered = GatheredBytes();
  if (storage_.size() < 2 * gathered || storage_.empty()) {
    std::vector<char> larger(std::max(kStorageBytesAtFirst, 2 * storage_.size()));
    std::copy_n(storage_.begin() + static_cast<std::ptrdiff_t>(begin_), gathered, larger.begin());
    storage_.swap(larger);
  } else {
    std::memmove(storage_.data(), storage_.data() + begin_, gathered);
  }
  begin_ = 0;
  end_ = gathered;
}

// A byte that does not fit starts the match again at itself; bytes before it are not looked at
// again.
void TokenFramer::MatchPrefix(unsigned char byte) {
  const char character = static_cast<char>(byte);
  if (character != prefix_[matched_]) {
    end_ = begin_;
    matched_ = 0;
    if (character != prefix_.front()) {
      return;
    }
  }
  Append(byte);
  ++matched_;
}

// Suffix and prefix do not share bytes: a suffix that begins within the prefix is none.
TokenFramer::Result TokenFramer::OnEndByte() {
  if (!suffix_.empty()) {
    if (GatheredBytes() >= prefix_.size() + suffix_.size() && EndsWith(suffix_)) {
      token_ = Cut(suffix_.size());
      return Result::kToken;
    }
  } else if (EndsWith(prefix_)) {
    token_ = Cut(prefix_.size());
    begin_ = end_ - prefix_.size();
    // The next token begins with its prefix gathered, which may be too much by itself.
    return prefix_.size() > kMaxGatheredBytes ? Result::kToken : Result::kTokenAndMore;
  }
  return GatheredBytes() > kMaxGatheredBytes ? Result::kDropped : Result::kMore;
}

bool TokenFramer::OnSilence() {
  if (matched_ < prefix_.size() || !suffix_.empty() || GatheredBytes() <= prefix_.size()) {
    return false;
  }
  token_ = Cut(0);
  return true;
}

bool TokenFramer::EndsWith(std::string_view mark) const {
  return GatheredBytes() >= mark.size() &&
         std::memcmp(storage_.data() + end_ - mark.size(), mark.data(), mark.size()) == 0;
}

// What lies between the prefix and the last `behindBytes` bytes. Framing marks may overlap (prefix
// 0202 in 02 02 02): the token is empty then.
std::string_view TokenFramer::Cut(std::size_t behindBytes) const {
  const std::size_t framingBytes = prefix_.size() + behindBytes;
  if (GatheredBytes() <= framingBytes) {
    return {};
  }
  return {storage_.data() + begin_ + prefix_.size(), GatheredBytes() - framingBytes};
}
