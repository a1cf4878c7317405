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
  endByte_ = mark.empty() ? kNoEndByte : static_cast<unsigned char>(mark.back());
  matched_ = 0;
  begin_ = storage_.data();
  end_ = begin_;
  SetStop();
  token_ = {};
}

// Until the prefix is there, every byte stops.
void TokenFramer::SetStop() {
  if (matched_ < prefix_.size() || GatheredBytes() >= kMaxGatheredBytes) {
    stop_ = end_;
    return;
  }
  const auto roomBytes = static_cast<std::size_t>(StorageEnd() - begin_);
  stop_ = begin_ + std::min(roomBytes, kMaxGatheredBytes);
}

TokenFramer::Result TokenFramer::OnByteAtStop(unsigned char byte) {
  if (matched_ < prefix_.size()) {
    MatchPrefix(byte);
    SetStop();
    return Result::kMore;
  }
  const bool isFull = GatheredBytes() >= kMaxGatheredBytes;
  Append(byte);
  SetStop();
  if (byte == endByte_) {
    return OnEndByte();
  }
  return isFull ? Result::kDropped : Result::kMore;
}

void TokenFramer::Append(unsigned char byte) {
  if (end_ == StorageEnd()) {
    MakeRoom();
  }
  *end_++ = static_cast<char>(byte);
}

// Moves what is gathered to the front, into more memory when that alone makes no room.
void TokenFramer::MakeRoom() {
  const std::size_t gathered = GatheredBytes();
  if (storage_.size() < 2 * gathered || storage_.empty()) {
    std::vector<char> larger(std::max(kStorageBytesAtFirst, 2 * storage_.size()));
    std::copy_n(begin_, gathered, larger.begin());
    storage_.swap(larger);
  } else {
    std::memmove(storage_.data(), begin_, gathered);
  }
  begin_ = storage_.data();
  end_ = begin_ + gathered;
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
    SetStop();
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
         std::memcmp(end_ - mark.size(), mark.data(), mark.size()) == 0;
}

// What lies between the prefix and the last `behindBytes` bytes. Framing marks may overlap (prefix
// 0202 in 02 02 02): the token is empty then.
std::string_view TokenFramer::Cut(std::size_t behindBytes) const {
  const std::size_t framingBytes = prefix_.size() + behindBytes;
  if (GatheredBytes() <= framingBytes) {
    return {};
  }
  return {begin_ + prefix_.size(), GatheredBytes() - framingBytes};
}
