// SPDX-License-Identifier: Apache-2.0
#include "host/sim/CommandDevice.h"

namespace {

// Devices do not mind lower case and blanks.
std::string Normal(const std::string& command) {
  const std::size_t begin = command.find_first_not_of(' ');
  const std::size_t end = command.find_last_not_of(' ');
  std::string text = begin == std::string::npos ? "" : command.substr(begin, end - begin + 1);
  for (char& character : text) {
    if (character >= 'a' && character <= 'z') {
      character = static_cast<char>(character - 'a' + 'A');
    }
  }
  return text;
}

}  // namespace

std::optional<DeviceMessage> CommandDevice::NextMessage() { return Framed(What(), NextText()); }

DeviceAnswer CommandDevice::OnBytes(std::string_view bytes) {
  DeviceAnswer answer;
  for (const char byte : bytes) {
    if (const auto command = collector_.OnByte(byte)) {
      OnCommand(*command, &answer);
    }
  }
  return answer;
}

DeviceAnswer CommandDevice::OnSilence() {
  DeviceAnswer answer;
  if (const auto command = collector_.Take()) {
    OnCommand(*command, &answer);
  }
  return answer;
}

std::string CommandDevice::NextText() {
  if (settings_.texts.empty()) {
    return NextBody();
  }
  return settings_.texts[nextText_++ % settings_.texts.size()];
}

DeviceMessage CommandDevice::Framed(const std::string& what, const std::string& body) const {
  return {what, settings_.framing, body, false};
}

void CommandDevice::AnswerWithNext(const std::string& what, DeviceAnswer* answer) {
  answer->replies.push_back(Framed(what, NextText()));
}

void CommandDevice::OnCommand(const std::string& command, DeviceAnswer* answer) {
  const std::string what = Obey(Normal(command), answer);
  answer->received.push_back({what.empty() ? "ignored" : what, command});
}
