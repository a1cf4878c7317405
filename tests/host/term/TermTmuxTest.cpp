// SPDX-License-Identifier: Apache-2.0
// loka term as a person sees it, in a terminal of its own, with a device on a pseudo-terminal.
#include <gtest/gtest.h>

#include <atomic>
#include <csignal>
#include <filesystem>
#include <optional>
#include <thread>

#include "host/port/PseudoTerminal.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/term/TmuxScreen.h"

namespace {

namespace fs = std::filesystem;

// Sends a token every 20 ms from its making to its end.
class TalkingDevice {
 public:
  explicit TalkingDevice(const PseudoTerminal* line)
      : thread_([this, line] {
          for (int n = 0; !isEnding_.load(); ++n) {
            (void)line->Send("w" + std::to_string(n) + "\x03", Deadline::After(1000));
            Deadline::After(20).Sleep();
          }
        }) {}
  ~TalkingDevice() {
    isEnding_.store(true);
    thread_.join();
  }
  TalkingDevice(const TalkingDevice&) = delete;
  TalkingDevice& operator=(const TalkingDevice&) = delete;

 private:
  std::atomic<bool> isEnding_{false};
  std::thread thread_;
};

class TermTmux : public testing::Test {
 protected:
  void SetUp() override {
    ASSERT_TRUE(screen_.IsRunning()) << "tmux does not run: " << screen_.Text();
    screen_.Line("stty -g > " + screen_.File("before"));
  }

  // Starts and waits for the prompt.
  void Start(const std::string& options = "", const std::string& portOptions = "") {
    screen_.Line("clear; loka term com1=" + line_->Path() + portOptions + " --config '" +
                 TestConfiguration("rx_suffix=03 tx_suffix=0D") + "' --no-store " + options);
    ASSERT_TRUE(screen_.AwaitLastLine("com1>")) << screen_.Text();
  }

  // The program has ended so, and the terminal is as it was.
  void ExpectEnd(const std::string& status) {
    EXPECT_TRUE(screen_.AwaitLastLine("shell$")) << screen_.Text();
    screen_.Line("echo \"status=$?\"");
    EXPECT_TRUE(screen_.Await("\nstatus=" + status + "\n")) << screen_.Text();
    screen_.Line("stty -g | cmp - " + screen_.File("before") + " && echo same \"state\"");
    EXPECT_TRUE(screen_.Await("\nsame state\n")) << screen_.Text();
  }

  void Key(const std::string& key) { screen_.Press({"C-t", key}); }

  void ExpectGets(const std::string& expected) {
    std::string bytes;
    EXPECT_TRUE(line_->Receive(expected.size(), Deadline::After(TmuxScreen::kLimitMs), &bytes));
    EXPECT_EQ(bytes, expected);
  }
  void DeviceSends(const std::string& bytes) {
    EXPECT_TRUE(line_->Send(bytes, Deadline::After(TmuxScreen::kLimitMs)));
  }

  std::optional<PseudoTerminal> line_{std::in_place};
  TmuxScreen screen_;
};

TEST_F(TermTmux, TheLineThatIsTypedStaysBelowTheTokens) {
  Start();
  {
    const TalkingDevice device(&*line_);
    ASSERT_TRUE(screen_.Await("\nw3\n")) << screen_.Text();
    screen_.Type("Hell World");
    EXPECT_TRUE(screen_.AwaitLastLine("com1> Hell World")) << screen_.Text();
    ASSERT_TRUE(screen_.Await("\nw30\n")) << screen_.Text();
    EXPECT_EQ(screen_.LastLine(), "com1> Hell World");
    screen_.Press({"Left", "Left", "Left", "Left", "Left", "Left", "o"});
    EXPECT_TRUE(screen_.AwaitLastLine("com1> Hello World")) << screen_.Text();
    ASSERT_TRUE(screen_.Await("\nw60\n")) << screen_.Text();
    screen_.Press({"Enter"});
    ExpectGets("Hello World\r");
  }
  EXPECT_TRUE(screen_.AwaitLastLine("com1>")) << screen_.Text();
  Key("q");
  ExpectEnd("0");
  // Nothing was printed twice or into the line, and nothing is missing.
  const std::string text = screen_.Text();
  for (int n = 0; n <= 60; ++n) {
    const std::string shown = "\nw" + std::to_string(n) + "\n";
    EXPECT_NE(text.find(shown), std::string::npos) << shown;
    EXPECT_EQ(text.find(shown), text.rfind(shown)) << shown;
  }
}

TEST_F(TermTmux, ALineOfSeveralRowsIsPutBackWhole) {
  Start();
  const std::string typed = std::string(120, 'x') + "y";
  screen_.Type(typed);
  const std::string shown = "com1> " + typed.substr(0, 94) + "\n" + typed.substr(94);
  ASSERT_TRUE(screen_.Await(shown)) << screen_.Text();
  DeviceSends("A\x03");
  EXPECT_TRUE(screen_.Await("\nA\n" + shown)) << screen_.Text();
  screen_.Press({"Enter"});
  ExpectGets(typed + "\r");
}

TEST_F(TermTmux, EachKeyDoesWhatTheListSays) {
  Start("--ack never --color never");
  Key("?");
  EXPECT_TRUE(screen_.Await("ctrl-t m       modem lines")) << screen_.Text();
  Key("c");
  EXPECT_TRUE(screen_.Await("rx_suffix         03          03      -       -")) << screen_.Text();
  Key("s");
  EXPECT_TRUE(screen_.Await("tokens 0  dropped 0")) << screen_.Text();
  Key("m");
  EXPECT_TRUE(screen_.Await("this line has no modem lines")) << screen_.Text();
  Key("d");
  EXPECT_TRUE(screen_.Await("nothing was staged")) << screen_.Text();
  Key("t");
  EXPECT_TRUE(screen_.Await("time stamps on")) << screen_.Text();
  Key("t");
  EXPECT_TRUE(screen_.Await("time stamps off")) << screen_.Text();
  Key("o");
  EXPECT_TRUE(screen_.Await("output: hex")) << screen_.Text();
  DeviceSends(
      "A\x03"
      "B\x03"
      "C\x03");
  EXPECT_TRUE(screen_.Await("\n41\n")) << screen_.Text();
  Key("a");
  EXPECT_TRUE(screen_.Await("1 token acknowledged")) << screen_.Text();
  EXPECT_TRUE(screen_.Await("\n42\n")) << screen_.Text();
  Key("A");
  EXPECT_TRUE(screen_.Await("2 tokens acknowledged")) << screen_.Text();
  Key("a");
  EXPECT_TRUE(screen_.Await("no token is waiting")) << screen_.Text();
  Key("C-t");
  ExpectGets("\x14\r");
  Key("x");
  EXPECT_TRUE(screen_.Await("ctrl-t x is no key; ctrl-t ? lists them")) << screen_.Text();
  Key("i");
  EXPECT_TRUE(screen_.AwaitLastLine("com1 hex>")) << screen_.Text();
  screen_.Line("02 42");
  ExpectGets(
      "\x02"
      "B\r");
  Key("i");
  EXPECT_TRUE(screen_.AwaitLastLine("com1 console>")) << screen_.Text();
  screen_.Line("set_rxSuffix 0D");
  EXPECT_TRUE(screen_.Await("in effect until the driver is restarted and never stored"))
      << screen_.Text();
  Key("c");
  EXPECT_TRUE(screen_.Await("rx_suffix 0D, set on the console, is in effect")) << screen_.Text();
  Key("i");
  EXPECT_TRUE(screen_.AwaitLastLine("com1>")) << screen_.Text();
  Key("q");
  ExpectEnd("0");
}

TEST_F(TermTmux, RawOutputIsTheOnlyOneThatMaySteerTheTerminal) {
  Start();
  DeviceSends("x\x1B[4Gy\x03");
  EXPECT_TRUE(screen_.Await("\nx\\x1b[4Gy\n")) << screen_.Text();
  Key("o");
  Key("o");
  Key("o");
  EXPECT_TRUE(screen_.Await("output: raw, bytes are not escaped")) << screen_.Text();
  DeviceSends("x\x1B[4Gy\x03");
  EXPECT_TRUE(screen_.Await("\nx  y\n")) << screen_.Text();
}

TEST_F(TermTmux, TheLogIsAskedForAndTheLineComesBack) {
  Start();
  const std::string log = screen_.File("log");
  screen_.Type("half");
  Key("L");
  EXPECT_TRUE(screen_.AwaitLastLine("log file>")) << screen_.Text();
  screen_.Line(log);
  EXPECT_TRUE(screen_.Await("log on: ")) << screen_.Text();
  EXPECT_TRUE(screen_.AwaitLastLine("com1> half")) << screen_.Text();
  DeviceSends("A\x03");
  ASSERT_TRUE(screen_.Await("\nA\n")) << screen_.Text();
  Key("L");
  EXPECT_TRUE(screen_.Await("log off: ")) << screen_.Text();
  DeviceSends("B\x03");
  ASSERT_TRUE(screen_.Await("\nB\n")) << screen_.Text();
  screen_.Press({"Enter"});
  ExpectGets("half\r");
  std::ifstream file(log);
  const std::string text{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
  EXPECT_NE(text.find("token 1  \"A\""), std::string::npos) << text;
  EXPECT_EQ(text.find("\"B\""), std::string::npos) << text;
}

TEST_F(TermTmux, LinesAreRememberedByTheUserAlone) {
  Start();
  screen_.Line("first");
  ExpectGets("first\r");
  screen_.Press({"C-d"});
  ExpectEnd("0");
  const std::string history = screen_.File("state/loka/history");
  EXPECT_EQ(fs::status(history).permissions(), fs::perms::owner_read | fs::perms::owner_write);
  Start();
  screen_.Press({"Up"});
  EXPECT_TRUE(screen_.AwaitLastLine("com1> first")) << screen_.Text();
}

TEST_F(TermTmux, CtrlCEndsItAndCtrlZAndCtrlBackslashDoNot) {
  Start();
  screen_.Press({"C-z", "C-\\", "a"});
  EXPECT_TRUE(screen_.AwaitLastLine("com1> a")) << screen_.Text();
  screen_.Press({"C-c"});
  EXPECT_TRUE(screen_.AwaitLastLine("shell$")) << screen_.Text();
  ExpectEnd("130");
}

TEST_F(TermTmux, TheTerminalIsPutBackAfterSignals) {
  for (const int signalNumber : {SIGTERM, SIGHUP, SIGABRT, SIGQUIT}) {
    Start();
    screen_.Type("half a line");
    ASSERT_TRUE(screen_.AwaitLastLine("com1> half a line")) << screen_.Text();
    screen_.Signal(signalNumber);
    EXPECT_TRUE(screen_.AwaitLastLine("shell$")) << screen_.Text();
    ExpectEnd(std::to_string(128 + signalNumber));
  }
}

TEST_F(TermTmux, TheTerminalIsPutBackAfterALostLine) {
  Start("", ",reconnect=off");
  screen_.Type("half a line");
  ASSERT_TRUE(screen_.AwaitLastLine("com1> half a line")) << screen_.Text();
  line_.reset();
  EXPECT_TRUE(screen_.Await("the line is lost and reconnect=off")) << screen_.Text();
  ExpectEnd("6");
}

}  // namespace
