// SPDX-License-Identifier: Apache-2.0
#include "host/sim/PrinterDevice.h"

#include <utility>

namespace {

constexpr char kEtx = '\x03';
constexpr char kEnq = '\x05';
constexpr std::string_view kEndWord = "^XZ";

}  // namespace

std::optional<DeviceMessage> PrinterDevice::NextMessage() {
  if (settings_.texts.empty()) {
    return std::nullopt;
  }
  const std::string& text = settings_.texts[nextText_++ % settings_.texts.size()];
  return DeviceMessage{"text", settings_.framing, text, false};
}

DeviceAnswer PrinterDevice::OnBytes(std::string_view bytes) {
  DeviceAnswer answer;
  for (const char byte : bytes) {
    if (byte == kEnq) {
      answer.received.push_back({"status request", std::string(1, byte)});
      answer.replies.push_back(
          {"status", settings_.framing, "READY," + std::to_string(labels_), false});
      continue;
    }
    label_ += byte;
    if (IsLabelEnd()) {
      ++labels_;
      answer.received.push_back({"label", std::exchange(label_, {})});
    }
  }
  return answer;
}

bool PrinterDevice::IsLabelEnd() const {
  const std::string_view label = label_;
  return label.back() == '\f' || label.back() == kEtx || label.size() >= kMaxLabelBytes ||
         (label.size() >= kEndWord.size() &&
          label.substr(label.size() - kEndWord.size()) == kEndWord);
}
