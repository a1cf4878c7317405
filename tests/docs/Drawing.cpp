// SPDX-License-Identifier: Apache-2.0
#include "tests/docs/Drawing.h"

#include <gtest/gtest.h>

#include <regex>
#include <sstream>

#include "driver/HexText.h"

namespace {

// The content of a line that is one text element of that class; false for any other line.
bool IsText(const std::string& line, const std::string& textClass, std::smatch& content) {
  static const std::regex kText(R"re(<text class="([^"]*)"[^>]*>([^<]*)</text>)re");
  return std::regex_search(line, content, kText) && content[1] == textClass;
}

void TakeSetting(const std::string& text, Drawing& drawing) {
  static const std::regex kSetting(R"(rx_prefix=(\w+) rx_suffix=(\w+) gap=(\d+)( \(500 ms\))?)");
  std::smatch match;
  ASSERT_TRUE(std::regex_match(text, match, kSetting)) << text;
  drawing.framing = {fromHex(match[1]), fromHex(match[2])};
  drawing.gapMs = std::stoi(match[3]);
  EXPECT_EQ(match[4].matched, drawing.gapMs == 0) << text;
}

void TakeByte(const std::string& label, const std::string& role, Drawing& drawing) {
  static const std::regex kByte(R"((?:(\d+) x )?([0-9A-F]{2}))");
  std::smatch match;
  ASSERT_TRUE(std::regex_match(label, match, kByte)) << label;
  Drawing::Event event;
  event.byte = static_cast<unsigned char>(fromHex(match[2])[0]);
  event.count = match[1].matched ? std::stoi(match[1]) : 1;
  event.role = role;
  drawing.events.push_back(event);
}

void TakePause(const std::string& label, Drawing& drawing) {
  Drawing::Event event;
  event.kind = Drawing::Event::Kind::kPause;
  event.pauseMs = std::stoi(label);
  EXPECT_EQ(label, std::to_string(event.pauseMs) + " ms");
  drawing.events.push_back(event);
}

}  // namespace

Drawing Drawing::From(const std::string& svg) {
  Drawing drawing;
  std::istringstream lines(svg);
  for (std::string line; std::getline(lines, line);) {
    std::smatch text;
    if (IsText(line, "setting", text)) TakeSetting(text[2], drawing);
    for (const char* role : {"prefix", "suffix", "body", "drop"}) {
      if (IsText(line, std::string("hex ") + role, text)) TakeByte(text[2], role, drawing);
    }
    if (IsText(line, "pause", text)) TakePause(text[2], drawing);
    if (IsText(line, "token", text)) {
      const std::string label = text[2];
      drawing.tokens.push_back(label.substr(1, label.size() - 2));
    }
    // The legend has the mark, too, in front of everything that is behind the axis.
    if (line.find("class=\"axis\"") != std::string::npos) break;
    if (line.find("<path class=\"queued\"") != std::string::npos) ++drawing.events.back().queued;
  }
  return drawing;
}
