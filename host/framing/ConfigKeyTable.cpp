// SPDX-License-Identifier: Apache-2.0
#include "host/framing/ConfigKeyTable.h"

#include <algorithm>

namespace {

using Kind = ConfigKey::Kind;

std::vector<ConfigKey> MakeKeys() {
  return {
      {"CfgVer", Kind::kNumber, true, "1", {}, "", "opens the section that this driver reads"},
      {"model", Kind::kText, true, "1", {}, "", "the device model; there is one"},
      {"port",
       Kind::kText,
       true,
       "com1",
       {"com1", "com2", "com3", "com4", "com5", "com6", "com7", "com8", "com9", "com10", "com11",
        "com12", "com13", "com14", "com15", "com16"},
       "any name that the host knows",
       "name of the serial port"},
      {"baudrate",
       Kind::kNumber,
       true,
       "9600",
       {"150", "300", "600", "1200", "2400", "4800", "9600", "19200", "38400", "57600", "115200"},
       "any number; the port decides",
       "bits a second"},
      {"parity", Kind::kText, true, "even", {"none", "even", "odd"}, "mark", "parity bit"},
      {"bits", Kind::kNumber, true, "8", {"7", "8"}, "any number; the port decides", "data bits"},
      {"stopbits",
       Kind::kNumber,
       true,
       "1",
       {"1", "2"},
       "any number; the port decides",
       "stop bits"},
      {"mode",
       Kind::kText,
       true,
       "RS-232",
       {"RS-232", "RS-485", "RS-422"},
       "",
       "electrical mode of the line"},
      {"rx_prefix", Kind::kHexText, false, "", {}, "", "what each received token begins with"},
      {"rx_suffix", Kind::kHexText, false, "", {}, "", "what each received token ends with"},
      {"gap",
       Kind::kNumber,
       false,
       "0",
       {},
       "",
       "silence in ms that ends a token or drops an unfinished one; 0 stands for 500"},
      {"tx_prefix", Kind::kHexText, false, "", {}, "", "what is sent in front of each token"},
      {"tx_suffix", Kind::kHexText, false, "", {}, "", "what is sent behind each token"},
      {"hex_tokens",
       Kind::kBoolean,
       false,
       "false",
       {},
       "",
       "tags show and take tokens as hexadecimal text; without it a token ends at its first zero "
       "byte"},
      {"token_queue_size",
       Kind::kNumber,
       false,
       "100",
       {},
       "",
       "tokens kept; the oldest one goes when another comes"},
      {"autoConnect", Kind::kBoolean, false, "true", {}, "", "open the port at the start"}};
}

}  // namespace

std::string ConfigKey::AllowedText() const {
  if (key == "CfgVer" || key == "model") {
    return "1";
  }
  if (key == "port") {
    return "com1 to com16";
  }
  if (key == "token_queue_size") {
    return std::to_string(kMinQueueTokens) + " to " + std::to_string(kMaxQueueTokens);
  }
  if (kind == Kind::kHexText) {
    return "pairs of hexadecimal digits, none or nothing";
  }
  if (kind == Kind::kBoolean) {
    return "true, false";
  }
  if (entries.empty()) {
    return "a number";
  }
  std::string text;
  for (const std::string_view entry : entries) {
    text += (text.empty() ? "" : ", ") + std::string(entry);
  }
  return text;
}

const std::vector<ConfigKey>& ConfigKeys() {
  static const std::vector<ConfigKey> kKeys = MakeKeys();
  return kKeys;
}

const ConfigKey* FindConfigKey(std::string_view key) {
  const std::vector<ConfigKey>& keys = ConfigKeys();
  const auto found = std::find_if(keys.begin(), keys.end(),
                                  [&](const ConfigKey& entry) { return entry.key == key; });
  return found == keys.end() ? nullptr : &*found;
}
