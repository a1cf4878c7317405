// SPDX-License-Identifier: Apache-2.0
#include "host/framing/FramingFlags.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <cctype>
#include <limits>
#include <string_view>

#include "host/framing/ConfigEdit.h"
#include "host/framing/ConfigKeyTable.h"
#include "host/framing/ControlNames.h"
#include "host/text/ByteText.h"

namespace {

bool IsSame(std::string_view left, std::string_view right) {
  return std::equal(left.begin(), left.end(), right.begin(), right.end(), [](char a, char b) {
    return std::toupper(static_cast<unsigned char>(a)) ==
           std::toupper(static_cast<unsigned char>(b));
  });
}

// The entry of the document that a value means, in either case; for the parity its first letter and
// for the mode its number are enough. Empty for none.
std::string Choose(const ConfigKey& key, const std::string& value) {
  std::vector<std::string_view> entries = key.entries;
  if (key.key == "parity") {
    entries.push_back(key.alsoAccepted);
  }
  for (const std::string_view entry : entries) {
    const bool isShort =
        (key.key == "parity" && value.size() == 1 && IsSame(value, entry.substr(0, 1))) ||
        (key.key == "mode" && IsSame(value, entry.substr(3)));
    if (isShort || IsSame(value, entry)) {
      return std::string(entry);
    }
  }
  return {};
}

// The long option of a key.
std::string OptionName(const std::string& key) {
  static const std::map<std::string, std::string> kOthers = {
      {"baudrate", "--baud"}, {"bits", "--data-bits"}, {"stopbits", "--stop-bits"}};
  const auto other = kOthers.find(key);
  std::string name = other == kOthers.end() ? "--" + key : other->second;
  std::replace(name.begin(), name.end(), '_', '-');
  return name;
}

std::string DefaultHint(const char* key) {
  const ConfigKey* const entry = FindConfigKey(key);
  return entry->defaultText.empty() ? "" : " [" + std::string(entry->defaultText) + "]";
}

}  // namespace

void FramingFlags::AddAll(CLI::App* command) {
  AddLine(command);
  AddReceiving(command);
  AddSending(command);
}

void FramingFlags::AddLine(CLI::App* command) {
  AddChoice(command, "-b,--baud", "baudrate", "N", "Bits a second");
  AddChoice(command, "-p,--parity", "parity", "NAME", "none, even, odd or mark");
  AddChoice(command, "-d,--data-bits", "bits", "N", "7 or 8");
  AddChoice(command, "-s,--stop-bits", "stopbits", "N", "1 or 2");
  AddChoice(command, "--mode", "mode", "NAME", "RS-232, RS-485 or RS-422");
}

void FramingFlags::AddReceiving(CLI::App* command) {
  AddBytes(command, "--rx-prefix", "rx_prefix", "Begins a received token: 02, STX, CRLF, none");
  AddBytes(command, "--rx-suffix", "rx_suffix", "Ends a received token");
  command
      ->add_option_function<int>(
          "--gap", [this](const int& gapMs) { given_["gap"] = std::to_string(gapMs); },
          "Silence that ends or drops a token; 0 is 500" + DefaultHint("gap"))
      ->type_name("MS")
      ->check(CLI::Range(0, std::numeric_limits<int>::max()).description(""));
  command->add_flag_function(
      "--hex", [this](std::int64_t count) { given_["hex_tokens"] = count > 0 ? "true" : "false"; },
      "Tokens as hexadecimal text; lets zero bytes through");
}

void FramingFlags::AddSending(CLI::App* command) {
  AddBytes(command, "--tx-prefix", "tx_prefix", "Sent in front of a token");
  AddBytes(command, "--tx-suffix", "tx_suffix", "Sent behind a token");
  command
      ->add_option_function<int>(
          "--queue",
          [this](const int& tokens) { given_["token_queue_size"] = std::to_string(tokens); },
          "Tokens kept" + DefaultHint("token_queue_size"))
      ->type_name("N")
      ->check(CLI::Range(kMinQueueTokens, kMaxQueueTokens).description(""));
}

void FramingFlags::AddConfiguring(CLI::App* command) {
  AddChoice(command, "--port", "port", "NAME", "The driver's name for the port, com1 to com16");
  command
      ->add_option_function<bool>(
          "--auto-connect",
          [this](const bool& isOn) { given_["autoConnect"] = isOn ? "true" : "false"; },
          "Open the port at the start" + DefaultHint("autoConnect"))
      ->type_name("true|false");
}

void FramingFlags::AddChoice(CLI::App* command, const char* flags, const char* key,
                             const char* typeName, const char* help) {
  const std::string name = key;
  command
      ->add_option_function<std::string>(
          flags,
          [this, name](const std::string& value) {
            const ConfigKey* const entry = FindConfigKey(name);
            const std::string chosen = Choose(*entry, value);
            if (chosen.empty()) {
              throw CLI::ValidationError(
                  OptionName(name), "\"" + EscapeBytes(value) + "\" is none of " +
                                        entry->AllowedText() + (name == "parity" ? ", mark" : ""));
            }
            given_[name] = chosen;
          },
          help + DefaultHint(key))
      ->type_name(typeName);
}

void FramingFlags::AddBytes(CLI::App* command, const char* flags, const char* key,
                            const char* help) {
  const std::string name = key;
  command
      ->add_option_function<std::string>(
          flags,
          [this, name](const std::string& value) {
            std::string bytes;
            std::string error;
            if (!ParseControlText(value, &bytes, &error)) {
              throw CLI::ValidationError(OptionName(name), error);
            }
            given_[name] = bytes.empty() ? "none" : CompactHex(bytes);
          },
          help)
      ->type_name("BYTES");
}

bool FramingFlags::Preset(const std::string& key, const std::string& value, std::string* error) {
  const ConfigKey* const entry = FindConfigKey(key);
  const std::string allowed = entry == nullptr ? "" : entry->AllowedText();
  const bool isAllowed = entry != nullptr && (entry->kind == ConfigKey::Kind::kBoolean
                                                  ? value == "true" || value == "false"
                                                  : value == allowed);
  if (!isAllowed) {
    *error = "\"" + EscapeBytes(value) + "\" is none of " + allowed;
    return false;
  }
  given_.emplace(key, value);
  return true;
}

std::string FramingFlags::Apply(const std::string& configuration) const {
  std::string text = configuration;
  for (const ConfigKey& entry : ConfigKeys()) {
    const auto given = given_.find(std::string(entry.key));
    if (given != given_.end()) {
      text = WithConfigValue(text, given->first, given->second);
    }
  }
  return text;
}

std::string FramingFlags::Configuration() const {
  std::string text;
  for (const ConfigKey& entry : ConfigKeys()) {
    const auto given = given_.find(std::string(entry.key));
    if (given != given_.end() || entry.isMandatory) {
      text += (text.empty() ? "" : " ") + std::string(entry.key) + "=" +
              (given != given_.end() ? given->second : std::string(entry.defaultText));
    }
  }
  return text;
}
