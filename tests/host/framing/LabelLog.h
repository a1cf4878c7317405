// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/framing/ByteLabeller.h"
#include "host/text/ByteText.h"

// Keeps what a labeller tells, and holds it to its promise: every byte once, in order.
class LabelLog final : public LabelSink {
 public:
  void OnLabelled(const LabelledBytes& labelled) override {
    isGapless_ = isGapless_ && labelled.offset == told_.size() && !labelled.bytes.empty();
    told_ += labelled.bytes;
    text_ +=
        (text_.empty() ? "" : " | ") + HexBytes(labelled.bytes) + " " +
        (labelled.role == ByteRole::kDropped ? NameOf(labelled.reason) : NameOf(labelled.role)) +
        (labelled.role == ByteRole::kDropped && labelled.afterMs > 0
             ? " " + std::to_string(labelled.afterMs)
             : "");
  }
  void OnCutToken(const CutToken& token) override {
    tokens_.push_back(token);
    text_ += " = \"" + EscapeBytes(token.bytes) + "\"";
  }

  bool IsGapless() const { return isGapless_; }
  // All bytes that were labelled.
  const std::string& Told() const { return told_; }
  const std::vector<CutToken>& Tokens() const { return tokens_; }
  // "02 prefix | 41 body | 03 suffix = "A"".
  const std::string& Text() const { return text_; }
  void Clear() { *this = LabelLog(); }

 private:
  bool isGapless_ = true;
  std::string told_;
  std::vector<CutToken> tokens_;
  std::string text_;
};
