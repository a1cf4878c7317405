// SPDX-License-Identifier: Apache-2.0
#include "host/port/PortOptions.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <set>

namespace {

constexpr int kMostTxDelayMs = 1000;
constexpr const char* kMilliseconds = "0 to 1000 ms";
constexpr const char* kPtyMark = "pty:";

// The words of "a|b|c".
std::vector<std::string> WordsOf(const std::string& values) {
  std::vector<std::string> words;
  for (std::size_t begin = 0; begin <= values.size();) {
    const std::size_t end = std::min(values.find('|', begin), values.size());
    words.push_back(values.substr(begin, end - begin));
    begin = end + 1;
  }
  return words;
}

bool ParseMilliseconds(const std::string& text, int* milliseconds) {
  constexpr std::size_t kMostDigits = 4;
  if (text.empty() || text.size() > kMostDigits ||
      text.find_first_not_of("0123456789") != std::string::npos) {
    return false;
  }
  *milliseconds = static_cast<int>(std::strtol(text.c_str(), nullptr, 10));
  return *milliseconds <= kMostTxDelayMs;
}

PortOptions::Level LevelFor(const std::string& value) {
  if (value == "keep") {
    return PortOptions::Level::kKeep;
  }
  return value == "on" ? PortOptions::Level::kOn : PortOptions::Level::kOff;
}

PortOptions::Flow FlowFor(const std::string& value) {
  if (value == "none") {
    return PortOptions::Flow::kNone;
  }
  return value == "rtscts" ? PortOptions::Flow::kRtsCts : PortOptions::Flow::kXonXoff;
}

PortOptions::Rs485 Rs485For(const std::string& value) {
  if (value == "auto") {
    return PortOptions::Rs485::kAuto;
  }
  if (value == "ioctl") {
    return PortOptions::Rs485::kIoctl;
  }
  return value == "rts" ? PortOptions::Rs485::kRts : PortOptions::Rs485::kOff;
}

// `value` is one of the table's words.
void Set(const std::string& name, const std::string& value, PortOptions* options) {
  if (name == "flow") {
    options->flow = FlowFor(value);
  } else if (name == "dtr") {
    options->dtr = LevelFor(value);
  } else if (name == "rts") {
    options->rts = LevelFor(value);
  } else if (name == "rs485") {
    options->rs485 = Rs485For(value);
  } else if (name == "echo") {
    options->stripsEcho = value == "strip";
  } else if (name == "flush") {
    options->flushesOnOpen = value == "on";
  } else if (name == "latency") {
    options->isLowLatency = value == "low";
  } else if (name == "hupcl") {
    options->hupcl = LevelFor(value);
  } else if (name == "reconnect") {
    options->reconnects = value == "on";
  }
}

std::string NamesOfAll() {
  std::string names;
  for (const PortOptionEntry& entry : PortOptionTable()) {
    names += (names.empty() ? "" : ", ") + std::string(entry.name);
  }
  return names;
}

bool ParseOne(const std::string& name, const std::string& value, PortOptions* options,
              std::string* error) {
  const auto& table = PortOptionTable();
  const auto entry = std::find_if(table.begin(), table.end(),
                                  [&](const PortOptionEntry& e) { return name == e.name; });
  if (entry == table.end()) {
    *error = "'" + name + "' is no port option; " + NamesOfAll() + " are";
    return false;
  }
  if (entry->values == kMilliseconds) {
    if (ParseMilliseconds(value, &options->txDelayMs)) {
      return true;
    }
    *error = name + "=" + value + ": expected " + kMilliseconds;
    return false;
  }
  const std::vector<std::string> words = WordsOf(entry->values);
  if (std::find(words.begin(), words.end(), value) == words.end()) {
    *error = name + "=" + value + ": expected " + entry->values;
    return false;
  }
  Set(name, value, options);
  return true;
}

// The same output cannot follow two masters.
std::string Contradiction(const PortOptions& options) {
  const bool isRtsFlow = options.flow == PortOptions::Flow::kRtsCts;
  const bool isRtsDirection = options.rs485 == PortOptions::Rs485::kRts;
  if (isRtsFlow && isRtsDirection) {
    return "flow=rtscts and rs485=rts both want the RTS line";
  }
  if (options.rts != PortOptions::Level::kKeep && isRtsFlow) {
    return "rts is switched by flow=rtscts; leave out one of the two";
  }
  if (options.rts != PortOptions::Level::kKeep && isRtsDirection) {
    return "rts is switched by rs485=rts; leave out one of the two";
  }
  return {};
}

}  // namespace

PortOptions PortOptions::For(const std::string& path) {
  PortOptions options;
  options.path = path;
  return options;
}

bool ParsePortOptions(const std::string& text, PortOptions* options, std::string* error) {
  PortOptions parsed;
  std::size_t begin = std::min(text.find(','), text.size());
  parsed.path = text.substr(0, begin);
  if (parsed.path.rfind(kPtyMark, 0) == 0) {
    parsed.path.erase(0, std::strlen(kPtyMark));
  }
  if (parsed.path.empty()) {
    *error = "a port needs a path";
    return false;
  }
  std::set<std::string> seen;
  while (begin < text.size()) {
    const std::size_t end = std::min(text.find(',', begin + 1), text.size());
    const std::string option = text.substr(begin + 1, end - begin - 1);
    const std::size_t equals = std::min(option.find('='), option.size());
    const std::string name = option.substr(0, equals);
    const std::string value = option.substr(std::min(equals + 1, option.size()));
    if (!ParseOne(name, value, &parsed, error)) {
      return false;
    }
    if (!seen.insert(name).second) {
      *error = name + " is given twice";
      return false;
    }
    begin = end;
  }
  *error = Contradiction(parsed);
  if (!error->empty()) {
    return false;
  }
  *options = parsed;
  return true;
}

const std::vector<PortOptionEntry>& PortOptionTable() {
  static const std::vector<PortOptionEntry> kTable = {
      {"flow", "none|rtscts|xonxoff",
       "flow control; with xonxoff the bytes 11 and 13 are not data"},
      {"dtr", "keep|on|off", "DTR once the port is open; Linux raises it while opening"},
      {"rts", "keep|on|off", "RTS likewise"},
      {"rs485", "auto|ioctl|rts|off", "direction: kernel if it can, kernel or fail, RTS, never"},
      {"echo", "keep|strip", "strip takes own bytes out of what is received"},
      {"flush", "off|on", "on drops what waits in the system's buffers when opening"},
      {"txdelay", kMilliseconds, "pause between two bytes of a send"},
      {"latency", "low|keep", "low asks the adapter to hand on bytes at once"},
      {"hupcl", "keep|on|off", "whether closing the port lowers DTR and RTS"},
      {"reconnect", "on|off", "off makes the loss of the line final"}};
  return kTable;
}

std::vector<std::string> DescribePortOptions() {
  constexpr std::size_t kColumn = 28;
  std::vector<std::string> lines;
  for (const PortOptionEntry& entry : PortOptionTable()) {
    std::string line = std::string(entry.name) + "=" + entry.values;
    line.resize(std::max(line.size() + 1, kColumn), ' ');
    lines.push_back(line + entry.help);
  }
  return lines;
}
