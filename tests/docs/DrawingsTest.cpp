// SPDX-License-Identifier: Apache-2.0
// The framing drawings: made by their script, shown in the manual, and true.
#include <gtest/gtest.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <functional>
#include <map>
#include <set>
#include <tuple>

#include "tests/docs/Drawing.h"
#include "tests/docs/MarkdownText.h"

namespace {

constexpr int kGapOfZeroMs = 500;
const char* const kFolder = "docs/images";

std::set<std::string> FilesIn(const std::string& folder) {
  std::set<std::string> names;
  for (const auto& entry : std::filesystem::directory_iterator(folder)) {
    names.insert(entry.path().filename().string());
  }
  return names;
}

std::set<std::string> DrawingFiles() {
  std::set<std::string> names = FilesIn(std::string(LOKA_SOURCE_DIR) + "/" + kFolder);
  EXPECT_GE(names.size(), 12U);
  return names;
}

Drawing Load(const std::string& name) {
  return Drawing::From(ReadProjectFile(std::string(kFolder) + "/" + name));
}

// Plays a drawing's bytes and pauses to the framer, as the receive task does.
class Player {
 public:
  explicit Player(const Drawing& drawing)
      : drawing_(drawing), gapMs_(drawing.gapMs == 0 ? kGapOfZeroMs : drawing.gapMs) {
    framer_.Begin(drawing_.framing);
  }

  void Play(const Drawing::Event& event) {
    if (event.kind == Drawing::Event::Kind::kPause) {
      if (event.pauseMs < gapMs_) return;
      if (framer_.OnSilence()) tokens_.emplace_back(framer_.Token());
      framer_.Begin(drawing_.framing);
      return;
    }
    for (int i = 0; i < event.count; ++i) PlayByte(event.byte);
  }

  const std::vector<std::string>& Tokens() const { return tokens_; }

 private:
  void PlayByte(unsigned char byte) {
    using Result = TokenFramer::Result;
    const Result result = framer_.OnByte(byte);
    if (result == Result::kToken || result == Result::kTokenAndMore) {
      tokens_.emplace_back(framer_.Token());
    }
    if (result == Result::kToken || result == Result::kDropped) framer_.Begin(drawing_.framing);
  }

  const Drawing& drawing_;
  const int gapMs_;
  TokenFramer framer_;
  std::vector<std::string> tokens_;
};

// The tokens when only the events are played that `isPlayed` lets through.
std::vector<std::string> TokensOf(const Drawing& drawing,
                                  const std::function<bool(const Drawing::Event&)>& isPlayed) {
  Player player(drawing);
  for (const Drawing::Event& event : drawing.events) {
    if (isPlayed(event)) player.Play(event);
  }
  return player.Tokens();
}

TEST(DrawingsTest, TheScriptMakesThem) {
  std::string folder = (std::filesystem::temp_directory_path() / "framing.XXXXXX").string();
  ASSERT_NE(mkdtemp(folder.data()), nullptr);
  const std::string command = "'" LOKA_SOURCE_DIR "/scripts/framing-drawings.sh' '" + folder + "'";
  ASSERT_EQ(std::system(command.c_str()), 0);
  EXPECT_EQ(FilesIn(folder), DrawingFiles());
  for (const std::string& name : DrawingFiles()) {
    const std::string made = std::filesystem::relative(folder, LOKA_SOURCE_DIR).string();
    EXPECT_TRUE(ReadProjectFile(made + "/" + name) ==
                ReadProjectFile(std::string(kFolder) + "/" + name))
        << name << " is not what the script makes";
  }
  std::filesystem::remove_all(folder);
}

TEST(DrawingsTest, TheManualShowsAllOfThem) {
  std::set<std::string> shown;
  const MarkdownText manual("docs/manual.md");
  for (const std::string& link : manual.Links()) {
    const std::filesystem::path path(link);
    if (path.parent_path() == "images") shown.insert(path.filename().string());
  }
  EXPECT_EQ(shown, DrawingFiles());
}

TEST(DrawingsTest, EveryCombinationIsDrawn) {
  std::set<std::tuple<bool, bool, bool>> drawn;
  for (const std::string& name : DrawingFiles()) {
    const Drawing drawing = Load(name);
    drawn.emplace(drawing.framing.prefix.empty(), drawing.framing.suffix.empty(),
                  drawing.gapMs == 0);
  }
  EXPECT_EQ(drawn.size(), 8U);
}

TEST(DrawingsTest, TheTokensAreThoseOfTheFramer) {
  for (const std::string& name : DrawingFiles()) {
    SCOPED_TRACE(name);
    const Drawing drawing = Load(name);
    ASSERT_GE(drawing.events.size(), 4U);
    Player player(drawing);
    std::size_t queued = 0;
    std::string body;
    for (const Drawing::Event& event : drawing.events) {
      player.Play(event);
      if (event.role == "body") body += static_cast<char>(event.byte);
      queued += static_cast<std::size_t>(event.queued);
      ASSERT_EQ(player.Tokens().size(), queued) << "at another byte or pause than drawn";
      if (event.queued != 0) {
        EXPECT_EQ(player.Tokens().back(), body) << "other bytes are blue";
        body.clear();
      }
    }
    EXPECT_EQ(body, "") << "blue bytes in no token";
    EXPECT_EQ(player.Tokens(), drawing.tokens);
    EXPECT_FALSE(drawing.tokens.empty());
  }
}

// Without the hatched bytes the tokens are the same, and every other byte is needed for them.
TEST(DrawingsTest, TheHatchedBytesAreThoseThatDoNotCount) {
  for (const std::string& name : DrawingFiles()) {
    SCOPED_TRACE(name);
    const Drawing drawing = Load(name);
    EXPECT_EQ(TokensOf(drawing, [](const auto& event) { return event.role != "drop"; }),
              drawing.tokens);
    for (const Drawing::Event& left : drawing.events) {
      if (left.kind != Drawing::Event::Kind::kByte || left.role == "drop") continue;
      EXPECT_NE(TokensOf(drawing, [&left](const auto& event) { return &event != &left; }),
                drawing.tokens)
          << "byte " << &left - drawing.events.data() << " makes no difference";
    }
  }
}

// What the manual says about the longest token.
TEST(DrawingsTest, TheLongestTokenIsAsLongAsSaid) {
  const auto longest = [](const RxFraming& framing, const std::string& end) {
    std::size_t length = 0;
    for (std::size_t body = 990; body < 1010; ++body) {
      Drawing drawing;
      drawing.framing = framing;
      Player player(drawing);
      for (const char c : framing.prefix + std::string(body, 'x') + end) {
        Drawing::Event event;
        event.byte = static_cast<unsigned char>(c);
        player.Play(event);
      }
      Drawing::Event silence;
      silence.kind = Drawing::Event::Kind::kPause;
      silence.pauseMs = kGapOfZeroMs;
      player.Play(silence);
      if (player.Tokens() == std::vector<std::string>{std::string(body, 'x')}) length = body;
    }
    return length;
  };
  EXPECT_EQ(longest({"", "\r"}, "\r"), 1000U);
  EXPECT_EQ(longest({"", "\r\n"}, "\r\n"), 999U);
  EXPECT_EQ(longest({"\x02", "\x03"}, "\x03"), 999U);
  EXPECT_EQ(longest({"", ""}, ""), 1000U);
  EXPECT_EQ(longest({"\x02", ""}, ""), 999U);
  EXPECT_EQ(MarkdownText("docs/manual.md").Rows("What").at(0).at(1),
            std::to_string(TokenFramer::kMaxGatheredBytes));
}

}  // namespace
