// SPDX-License-Identifier: Apache-2.0
#include "host/framing/ConfigReport.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <set>
#include <sstream>

#include "host/framing/ConfigEdit.h"
#include "host/framing/ConfigKeyTable.h"
#include "host/framing/ConfigNumber.h"
#include "host/framing/ConfigText.h"
#include "host/text/ByteText.h"

namespace {

using Notes = std::vector<std::string>;

constexpr std::size_t kComParams = 6;

std::string FrameText(const std::string& prefix, const std::string& suffix, const char* ifNone) {
  return prefix.empty() && suffix.empty() ? ifNone : CompactHex(prefix) + "…" + CompactHex(suffix);
}

std::string GapText(const FramingSettings& settings) {
  return "gap " + std::to_string(settings.gapMs) +
         (settings.gapMs == 0 ? " (" + std::to_string(FramingSettings::kDefaultGapMs) + " ms)"
                              : " ms");
}

std::vector<std::string> Split(const std::string& text, char separator) {
  std::vector<std::string> parts;
  std::istringstream stream(text);
  for (std::string part; std::getline(stream, part, separator);) {
    parts.push_back(part);
  }
  return parts;
}

std::vector<std::string> LineOfConfiguration(const std::string& configuration) {
  std::vector<std::string> parts;
  for (const char* const key : {"port", "baudrate", "parity", "bits", "stopbits", "mode"}) {
    std::string value = ConfigValue(configuration, key, "?");
    if (FindConfigKey(key)->kind == ConfigKey::Kind::kNumber && value != "?") {
      value = std::to_string(ParseConfigNumber(value).value);
    }
    parts.push_back(value);
  }
  return parts;
}

char ParityLetter(const std::string& parity) {
  return parity.empty() ? '?'
                        : static_cast<char>(std::toupper(static_cast<unsigned char>(parity[0])));
}

// The key without "Node7::" in front; the same text when it has none.
std::string WithoutNode(const std::string& key) {
  const std::size_t colons = key.find("::");
  const bool isNode = key.compare(0, 4, "Node") == 0 && colons != std::string::npos;
  return isNode ? key.substr(colons + 2) : key;
}

// The known key that differs in its case or in one character; empty when there is none.
std::string SimilarKey(const std::string& key) {
  for (const ConfigKey& entry : ConfigKeys()) {
    const std::string_view known = entry.key;
    const std::size_t longest = std::max(known.size(), key.size());
    const std::size_t shortest = std::min(known.size(), key.size());
    if (longest - shortest > 1) {
      continue;
    }
    std::size_t front = 0;
    std::size_t back = 0;
    const auto isSame = [](char a, char b) {
      return std::tolower(static_cast<unsigned char>(a)) ==
             std::tolower(static_cast<unsigned char>(b));
    };
    while (front < shortest && isSame(known[front], key[front])) {
      ++front;
    }
    while (back < shortest - front &&
           isSame(known[known.size() - 1 - back], key[key.size() - 1 - back])) {
      ++back;
    }
    if (front + back + 1 >= longest) {
      return std::string(known);
    }
  }
  return {};
}

void NoteNumber(const std::string& key, const std::string& value, Notes* notes) {
  const ConfigNumber number = ParseConfigNumber(value);
  const std::string start = key + "=" + EscapeBytes(value) + ": ";
  if (!number.isNumber) {
    notes->push_back(start + "no number, the driver reads 0");
  } else if (number.hasRest) {
    notes->push_back(start + "read as " + std::to_string(number.value) +
                     ", what stands behind the digits is ignored");
  } else if (number.base == 8) {
    notes->push_back(start + "read as " + std::to_string(number.value) +
                     ", since a leading 0 means octal");
  }
}

void NoteEntry(const ConfigKey& entry, const std::string& value, Notes* notes) {
  const std::string shown = entry.kind == ConfigKey::Kind::kNumber
                                ? std::to_string(ParseConfigNumber(value).value)
                                : value;
  const auto& entries = entry.entries;
  if (entries.empty() || entry.alsoAccepted.empty() ||
      std::find(entries.begin(), entries.end(), shown) != entries.end()) {
    return;
  }
  notes->push_back(std::string(entry.key) + "=" + EscapeBytes(value) +
                   ": not among what the driver's description offers (" + entry.AllowedText() +
                   "); the driver also takes " + std::string(entry.alsoAccepted));
}

void NotePair(const std::string& key, const std::string& value, Notes* notes) {
  const ConfigKey* const entry = FindConfigKey(key);
  if (entry == nullptr) {
    const std::string plain = WithoutNode(key);
    const std::string similar = SimilarKey(plain);
    if (plain != key && plain != "model" && FindConfigKey(plain) != nullptr) {
      notes->push_back(EscapeBytes(key) + ": ignored, only model may be set for a node");
    } else if (plain == key) {
      notes->push_back(EscapeBytes(key) + ": no key of this driver, ignored" +
                       (similar.empty() ? "" : "; meant " + similar + "?"));
    }
    return;
  }
  if (entry->kind == ConfigKey::Kind::kNumber) {
    NoteNumber(key, value, notes);
  }
  NoteEntry(*entry, value, notes);
}

void NoteWords(const std::string& configuration, Notes* notes) {
  std::set<std::string> seen;
  for (const auto& [key, value] : ConfigPairs(configuration)) {
    if (!seen.insert(key).second) {
      notes->push_back(EscapeBytes(key) + ": stands here more than once, the first one counts");
      continue;
    }
    NotePair(key, value, notes);
  }
  for (const std::string& word : ConfigStrayWords(configuration)) {
    notes->push_back("\"" + EscapeBytes(word) +
                     "\" is no key=value and is ignored; a blank ends a value (&nbsp; is one)");
  }
}

bool OverlapsItself(const std::string& text) {
  for (std::size_t shift = 1; shift < text.size(); ++shift) {
    if (text.compare(shift, std::string::npos, text, 0, text.size() - shift) == 0) {
      return true;
    }
  }
  return false;
}

// Two characters of 11 bits, in whole milliseconds.
int TwoCharactersMs(int baudrate) {
  constexpr int kTwoCharactersBits = 22;
  return baudrate <= 0 ? 0 : (kTwoCharactersBits * 1000 + baudrate - 1) / baudrate;
}

void NoteFraming(const std::string& configuration, Notes* notes) {
  const FramingSettings settings = FramingOfConfiguration(configuration);
  const std::string silence = std::to_string(std::max(settings.SilenceMs(), 1)) + " ms";
  if (settings.gapMs < 0) {
    notes->push_back("gap=" + std::to_string(settings.gapMs) + ": a port waits 1 ms at least");
  }
  const int baudrate = ParseConfigNumber(ConfigValue(configuration, "baudrate", "0")).value;
  if (std::max(settings.SilenceMs(), 1) < TwoCharactersMs(baudrate)) {
    notes->push_back("gap: " + silence + " is shorter than two characters at " +
                     std::to_string(baudrate) + " baud; tokens are cut between their bytes");
  }
  if (!settings.rxSuffix.empty()) {
    notes->push_back("gap: a silence of " + silence +
                     " in front of the suffix drops the token; a longer gap allows slow lines");
  } else if (OverlapsItself(settings.rxPrefix)) {
    notes->push_back(
        "rx_prefix: it overlaps itself; without a suffix its bytes repeated make empty tokens");
  }
}

}  // namespace

std::string ReceivingText(const FramingSettings& settings) {
  return "rx " + FrameText(settings.rxPrefix, settings.rxSuffix, "by silence") + "  " +
         GapText(settings);
}

std::string ConfigLine(const std::string& configuration, const std::string& comParams) {
  std::vector<std::string> line = Split(comParams, ',');
  if (line.size() != kComParams) {
    line = LineOfConfiguration(configuration);
  }
  const FramingSettings settings = FramingOfConfiguration(configuration);
  return EscapeBytes(line[0] + " " + line[1] + " " + line[3] + ParityLetter(line[2]) + line[4] +
                     " " + line[5]) +
         "  rx " + FrameText(settings.rxPrefix, settings.rxSuffix, "by silence") + "  tx " +
         FrameText(settings.txPrefix, settings.txSuffix, "bare") + "  " + GapText(settings) +
         "  queue " + std::to_string(settings.queueTokens) +
         (settings.isHex ? "  hex tokens" : "") +
         (ConfigValue(configuration, "autoConnect", "true") == "false" ? "  closed at start" : "");
}

std::vector<std::string> ConfigNotes(const std::string& configuration) {
  Notes notes;
  NoteWords(configuration, &notes);
  NoteFraming(configuration, &notes);
  return notes;
}

std::vector<std::string> ConfigTable(const std::string& configuration) {
  std::vector<std::string> lines;
  for (const ConfigKey& entry : ConfigKeys()) {
    const std::string key(entry.key);
    // The marker itself is not looked up like a key: the section begins behind it.
    const bool isGiven = key == "CfgVer" ? configuration.find("CfgVer=1") != std::string::npos
                                         : ConfigValue(configuration, key, "\n") != "\n";
    const std::string value = isGiven && key != "CfgVer" ? ConfigValue(configuration, key, "")
                                                         : std::string(entry.defaultText);
    std::string line = key + "=" + EscapeBytes(isGiven || !entry.isMandatory ? value : "");
    line.resize(std::max<std::size_t>(line.size() + 2, 24), ' ');
    line += isGiven ? "given" : entry.isMandatory ? "MISSING" : "default";
    line += entry.isMandatory || isGiven
                ? " (default " +
                      (entry.defaultText.empty() ? "nothing" : std::string(entry.defaultText)) + ")"
                : "";
    lines.push_back(line + "; " + entry.AllowedText() +
                    (entry.alsoAccepted.empty()
                         ? ""
                         : " (the driver also takes " + std::string(entry.alsoAccepted) + ")") +
                    "; " + std::string(entry.meaning));
  }
  return lines;
}
