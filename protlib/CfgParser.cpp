// SPDX-License-Identifier: Apache-2.0
#include "protlib/CfgParser.h"

#include <algorithm>

#include "protlib/ParseInt.h"

namespace {

constexpr const char* kSectionMark = "CfgVer=";
constexpr const char* kOurSectionMark = "CfgVer=1";
constexpr const char* kNodeMark = "Node";
constexpr const char* kNodeSeparator = "::";

bool IsDigit(char c) { return c >= '0' && c <= '9'; }

// White space of the "C" locale, whatever locale the host has set.
bool IsSpace(char c) { return c == ' ' || (c >= '\t' && c <= '\r'); }

}  // namespace

CfgParser::CfgParser(const char* cfg) : text_(cfg) {
  SelectSection();
  if (knownFormat_) {
    FindNodes();
  }
}

void CfgParser::SelectSection() {
  const std::size_t mark = text_.find(kOurSectionMark);
  if (mark == std::string::npos) {
    return;
  }
  knownFormat_ = true;
  const std::size_t begin = mark + std::char_traits<char>::length(kOurSectionMark);
  const std::size_t end = text_.find(kSectionMark, begin);
  text_ = text_.substr(begin, end == std::string::npos ? end : end - begin);
}

void CfgParser::FindNodes() {
  const std::size_t markLength = std::char_traits<char>::length(kNodeMark);
  std::size_t mark = text_.find(kNodeMark);
  while (mark != std::string::npos) {
    const std::size_t digits = mark + markLength;
    std::size_t end = digits;
    while (end < text_.size() && IsDigit(text_[end])) {
      ++end;
    }
    if (text_.compare(end, 2, kNodeSeparator) == 0) {
      const int id = ParseInt(text_.substr(digits, end - digits).c_str(), 10);
      if (std::find(nodeIds_.begin(), nodeIds_.end(), id) == nodeIds_.end()) {
        nodeIds_.push_back(id);
      }
    }
    mark = text_.find(kNodeMark, end);
  }
}

int CfgParser::GetNodeID(int index) const {
  return index >= 0 && index < GetNodeCount() ? nodeIds_[static_cast<std::size_t>(index)] : 0;
}

const char* CfgParser::GetParam(const char* name) {
  const std::string key = std::string(name) + "=";
  for (std::size_t at = text_.find(key); at != std::string::npos; at = text_.find(key, at + 1)) {
    if (at != 0 && !IsSpace(text_[at - 1])) {
      continue;  // the tail of a longer key
    }
    const auto begin = text_.begin() + static_cast<std::ptrdiff_t>(at + key.size());
    lastValue_.assign(begin, std::find_if(begin, text_.end(), IsSpace));
    return lastValue_.c_str();
  }
  return nullptr;
}

CfgParser::parseResult CfgParser::getParam(const char* name, int node, std::string& out,
                                           int flags) {
  if ((flags & cfgCommonOnly) != 0 && (flags & cfgNodeOnly) != 0) {
    return prInvalidSpecification;
  }
  if (node != kNoNode) {
    const std::string nodeName = kNodeMark + std::to_string(node) + kNodeSeparator + name;
    if (const char* value = GetParam(nodeName.c_str())) {
      if ((flags & cfgCommonOnly) != 0) {
        return prCantBePrefixed;
      }
      out = value;
      return prOk;
    }
  }
  const char* value = GetParam(name);
  if (node == kNoNode && !nodeIds_.empty() && (flags & cfgNodeOnly) != 0) {
    return value != nullptr ? prCantBeNodeIndependent : prNodeDependent;
  }
  if (value == nullptr) {
    return prNotFound;
  }
  out = value;
  return prOk;
}
