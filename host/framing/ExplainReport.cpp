// SPDX-License-Identifier: Apache-2.0
#include "host/framing/ExplainReport.h"

#include <algorithm>
#include <nlohmann/json.hpp>
#include <utility>

#include "host/events/JsonLine.h"
#include "host/text/ByteText.h"

namespace {

constexpr std::size_t kMaxShownBytes = 64;  // of bytes in a row with one role
constexpr std::size_t kHeadBytes = 48;

std::string ShownHex(const std::string& bytes) {
  if (bytes.size() <= kMaxShownBytes) {
    return HexBytes(bytes);
  }
  const std::size_t tail = kMaxShownBytes - kHeadBytes;
  return HexBytes(bytes.substr(0, kHeadBytes)) + " ... " +
         HexBytes(bytes.substr(bytes.size() - tail)) + " (" + std::to_string(bytes.size()) +
         " bytes)";
}

// "no-suffix" as words.
std::string ReasonWords(const LabelledBytes& labelled) {
  std::string words = NameOf(labelled.reason);
  std::replace(words.begin(), words.end(), '-', ' ');
  return words + (labelled.afterMs > 0 ? " after " + std::to_string(labelled.afterMs) + " ms" : "");
}

}  // namespace

ExplainReport::ExplainReport(bool isJson, const TextStyle& style, LineWriter writer)
    : isJson_(isJson), style_(style), writer_(std::move(writer)) {}

void ExplainReport::OnLabelled(const LabelledBytes& labelled) {
  if (labelled.role == ByteRole::kDropped) {
    droppedBytes_ += labelled.bytes.size();
    reasons_.insert(labelled.reason);
  }
  endedAfterMs_ = labelled.afterMs;
  if (isJson_) {
    WriteJson(labelled);
  } else {
    AddText(labelled);
  }
}

void ExplainReport::AddText(const LabelledBytes& labelled) {
  const std::string hex = ShownHex(labelled.bytes);
  line_ += line_.empty() ? "" : "  ";
  switch (labelled.role) {
    case ByteRole::kDropped:
      line_ += style_.Red(hex + " dropped (" + ReasonWords(labelled) + ")");
      break;
    case ByteRole::kBody:
      line_ += hex + " body";
      break;
    default:
      line_ += style_.Dim(hex + " " + NameOf(labelled.role));
  }
  // What was dropped at a silence has nothing behind it on its line.
  if (labelled.role == ByteRole::kDropped && labelled.afterMs > 0) {
    Finish();
  }
}

void ExplainReport::WriteJson(const LabelledBytes& labelled) {
  const bool isDrop = labelled.role == ByteRole::kDropped;
  nlohmann::ordered_json json;
  json["ev"] = isDrop ? "drop" : "label";
  json["at"] = labelled.offset;
  json[isDrop ? "why" : "role"] = isDrop ? NameOf(labelled.reason) : NameOf(labelled.role);
  if (isDrop && labelled.afterMs > 0) {
    json["after_ms"] = labelled.afterMs;
  }
  json["hex"] = CompactHex(labelled.bytes);
  writer_(JsonLine(json));
}

void ExplainReport::OnCutToken(const CutToken& token) {
  tokens_.push_back(token.bytes);
  hasZeroByte_ = hasZeroByte_ || token.bytes.find('\0') != std::string::npos;
  if (isJson_) {
    nlohmann::ordered_json json;
    json["ev"] = "token";
    json["at"] = token.offset;
    json["n"] = tokens_.size();
    json["len"] = token.bytes.size();
    json["text"] = token.bytes;
    json["hex"] = CompactHex(token.bytes);
    writer_(JsonLine(json));
    return;
  }
  line_ += "   " + style_.Bold("token \"" + EscapeBytes(token.bytes) + "\"");
  if (endedAfterMs_ > 0) {
    line_ += " (ended by " + std::to_string(endedAfterMs_) + " ms of silence)";
  }
  Finish();
}

void ExplainReport::Finish() {
  if (!line_.empty()) {
    writer_(std::exchange(line_, {}));
  }
}
