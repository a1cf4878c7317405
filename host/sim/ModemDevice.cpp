// SPDX-License-Identifier: Apache-2.0
#include "host/sim/ModemDevice.h"

#include <array>
#include <utility>

namespace {

constexpr std::array<const char*, 3> kReports = {"RING", "+CMTI: \"SM\",1", "+CREG: 1"};

std::string UpperCase(std::string text) {
  for (char& character : text) {
    if (character >= 'a' && character <= 'z') {
      character = static_cast<char>(character - 'a' + 'A');
    }
  }
  return text;
}

}  // namespace

std::optional<DeviceMessage> ModemDevice::NextMessage() {
  if (settings_.texts.empty()) {
    return Framed("report", kReports[next_++ % kReports.size()]);
  }
  return Framed("report", settings_.texts[next_++ % settings_.texts.size()]);
}

DeviceAnswer ModemDevice::OnBytes(std::string_view bytes) {
  DeviceAnswer answer;
  for (const char byte : bytes) {
    if (byte == '\n') {
      continue;
    }
    if (hasEcho_) {
      Echo(byte, &answer);
    }
    if (byte == '\r') {
      OnCommand(std::exchange(command_, {}), &answer);
    } else if (command_.size() < kMaxCommandBytes) {
      command_ += byte;
    }
  }
  return answer;
}

// Bytes echoed in a row are one piece.
void ModemDevice::Echo(char byte, DeviceAnswer* answer) const {
  if (answer->replies.empty() || !answer->replies.back().isVerbatim) {
    answer->replies.push_back({"echo", {}, "", true});
  }
  answer->replies.back().body += byte;
}

void ModemDevice::OnCommand(const std::string& command, DeviceAnswer* answer) {
  const std::string text = UpperCase(command);
  if (text.empty()) {
    return;
  }
  const bool isKnown = text.compare(0, 2, "AT") == 0 && Obey(text.substr(2), answer);
  answer->received.push_back({isKnown ? "command" : "unknown command", command});
  answer->replies.push_back(Framed("result", isKnown ? "OK" : "ERROR"));
}

bool ModemDevice::Obey(const std::string& command, DeviceAnswer* answer) {
  if (command == "E0" || command == "E1" || command == "Z") {
    hasEcho_ = command != "E0";
  } else if (command == "I") {
    answer->replies.push_back(Framed("reply", "LOKA SIM MODEM 1"));
  } else if (command == "+CSQ") {
    answer->replies.push_back(Framed("reply", "+CSQ: 17,99"));
  } else if (command == "+CREG?") {
    answer->replies.push_back(Framed("reply", "+CREG: 0,1"));
  } else {
    return command.empty() || command == "H";
  }
  return true;
}

DeviceMessage ModemDevice::Framed(const char* what, const std::string& body) const {
  return {what, settings_.framing, body, false};
}
