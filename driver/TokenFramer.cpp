// SPDX-License-Identifier: Apache-2.0
#include "driver/TokenFramer.h"

void TokenFramer::Begin(const RxFraming& framing) {
  framing_ = &framing;
  gathered_.clear();
  matched_ = 0;
  count_ = framing.prefix.size();
  restartAtPrefix_ = false;
  token_ = {};
}

TokenFramer::Result TokenFramer::OnByte(unsigned char byte) {
  const char character = static_cast<char>(byte);
  if (matched_ < framing_->prefix.size()) {
    MatchPrefix(character);
    return Result::kMore;
  }
  if (restartAtPrefix_) {
    gathered_ = framing_->prefix;
    restartAtPrefix_ = false;
  }
  return OnBodyByte(character);
}

// A byte that does not fit starts the match again at itself; bytes before it are not looked at
// again.
void TokenFramer::MatchPrefix(char byte) {
  const std::string& prefix = framing_->prefix;
  if (byte != prefix[matched_]) {
    gathered_.clear();
    matched_ = 0;
    if (byte != prefix[0]) {
      return;
    }
  }
  gathered_.push_back(byte);
  ++matched_;
}

TokenFramer::Result TokenFramer::OnBodyByte(char byte) {
  const std::string& prefix = framing_->prefix;
  const std::string& suffix = framing_->suffix;
  gathered_.push_back(byte);
  ++count_;
  if (count_ >= prefix.size() + suffix.size()) {
    if (!suffix.empty() && EndsWith(suffix)) {
      token_ = Cut(suffix.size());
      return Result::kToken;
    }
    if (suffix.empty() && !prefix.empty() && EndsWith(prefix)) {
      token_ = Cut(prefix.size());
      restartAtPrefix_ = true;
      // The next token begins with its prefix gathered, which may be too much by itself.
      return prefix.size() > kMaxGatheredBytes ? Result::kToken : Result::kTokenAndMore;
    }
  }
  return gathered_.size() > kMaxGatheredBytes ? Result::kDropped : Result::kMore;
}

bool TokenFramer::OnSilence() {
  const std::size_t prefixBytes = framing_->prefix.size();
  if (restartAtPrefix_ || matched_ < prefixBytes || !framing_->suffix.empty() ||
      gathered_.size() <= prefixBytes) {
    return false;
  }
  token_ = Cut(0);
  return true;
}

bool TokenFramer::EndsWith(const std::string& mark) const {
  // The last byte decides most of the time.
  return gathered_.back() == mark.back() && gathered_.size() >= mark.size() &&
         gathered_.compare(gathered_.size() - mark.size(), mark.size(), mark) == 0;
}

// What lies between the prefix and the last `behindBytes` bytes. Framing marks may overlap (prefix
// 0202 in 02 02 02): the token is empty then.
std::string_view TokenFramer::Cut(std::size_t behindBytes) const {
  const std::size_t framingBytes = framing_->prefix.size() + behindBytes;
  if (gathered_.size() <= framingBytes) {
    return {};
  }
  return std::string_view(gathered_).substr(framing_->prefix.size(),
                                            gathered_.size() - framingBytes);
}
