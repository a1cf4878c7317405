// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <functional>
#include <set>
#include <string>
#include <vector>

#include "host/framing/ByteLabeller.h"
#include "host/text/TextStyle.h"

// Writes what a labeller tells as lines for people or as NDJSON. One thread.
class ExplainReport final : public LabelSink {
 public:
  using LineWriter = std::function<void(const std::string& line)>;

  // The writer takes each line, without its end, as soon as it is whole.
  ExplainReport(bool isJson, const TextStyle& style, LineWriter writer);

  void OnLabelled(const LabelledBytes& labelled) override;
  void OnCutToken(const CutToken& token) override;

  // Ends the line in progress.
  void Finish();

  const std::vector<std::string>& Tokens() const { return tokens_; }
  std::uint64_t DroppedBytes() const { return droppedBytes_; }
  const std::set<DropReason>& Reasons() const { return reasons_; }
  // A token holds a zero byte, at which tags end outside hex mode.
  bool HasZeroByte() const { return hasZeroByte_; }

 private:
  void AddText(const LabelledBytes& labelled);
  void WriteJson(const LabelledBytes& labelled);

  const bool isJson_;
  const TextStyle style_;
  const LineWriter writer_;
  std::string line_;
  int endedAfterMs_ = 0;  // the silence that ends the token whose labels are told
  std::vector<std::string> tokens_;
  std::uint64_t droppedBytes_ = 0;
  std::set<DropReason> reasons_;
  bool hasZeroByte_ = false;
};
