// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "tests/host/commands/InstanceRun.h"
#include "tests/host/support/TextParts.h"

namespace {

using Json = nlohmann::json;

TEST(SetCommand, StagesThenAppliesAndStores) {
  InstanceRun instance("baudrate=9600 rx_suffix=03");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  ASSERT_TRUE(instance.DeviceSends("A\x03", "1"));
  EXPECT_EQ(instance.Output({"set", "rx_suffix=0D0A", "baud=19200", "--stage"}),
            "staged: baud 19200 (active 115200), rx_suffix 0D0A (active 03)\n");
  // Staged only: nothing is cut by the new suffix, nothing stored, nothing cleared.
  EXPECT_EQ(instance.Output({"read", "0?tokens_available?unsignedInt"}), "1\n");
  EXPECT_EQ(instance.Output({"store", "ls"}), "");
  EXPECT_EQ(instance.Output({"set", "gap=30"}),
            "staged: gap 30 (active 0)\napplied and stored; 1 waiting token cleared\n");
  EXPECT_EQ(instance.Output({"store", "ls"}),
            "baud 19200  rx_suffix 0D0A  gap 30   (override the configuration)\n");
  EXPECT_EQ(instance.Output({"read", "0?SP_RxSuffix?string-9"}), "0D0A\n");
}

TEST(SetCommand, SaysWhatWasStagedBeforeAndAppliedAsWell) {
  InstanceRun instance("");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  EXPECT_EQ(instance.Loka({"set", "--stage", "gap=30"}).status, 0);
  const InstanceRun::Result set = instance.Loka({"set", "-q", "parity=even"});
  EXPECT_EQ(set.output, "staged: parity even (active none)\napplied and stored\n");
  EXPECT_EQ(set.errors, "loka: staged before and applied as well: gap 30 (was 0)\n");
}

TEST(SetCommand, ChecksAllValuesBeforeTheFirstIsStaged) {
  InstanceRun instance("");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  for (const char* const wrong : {"bits=9", "bogus=1", "gap", "rx_suffix=STQ", "gap=30", "gap="}) {
    const InstanceRun::Result set = instance.Loka({"set", "gap=20", "parity=odd", wrong});
    EXPECT_EQ(set.status, 2) << wrong;
    EXPECT_EQ(set.output, "");
    EXPECT_NE(set.errors, "");
  }
  EXPECT_FALSE(Holds(instance.Errors(), "staged")) << instance.Errors();
  EXPECT_TRUE(Holds(instance.Loka({"set", "bits=9"}).errors, "bits is 7 or 8, not \"9\""));
  EXPECT_TRUE(Holds(instance.Loka({"set", "bogus=1"}).errors, "there are baud, parity, bits"));
  EXPECT_TRUE(Holds(instance.Loka({"set", "gap=1", "gap=2"}).errors, "gap is given twice"));
}

TEST(SetCommand, TakesNamesOfControlBytesParitiesAndModes) {
  InstanceRun instance("");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  EXPECT_EQ(instance.Output({"set", "--stage", "rx_prefix=STX", "rx_suffix=CR LF", "tx_suffix=none",
                             "parity=space", "mode=RS-422", "hex_tokens=on", "stopbits=2",
                             "tx_prefix=FF"}),
            "staged: parity space (active none), stop 2 (active 1), mode RS-422 (active RS-232), "
            "rx_prefix 02 (active none), rx_suffix 0D0A (active none), tx_prefix FF (active none), "
            "tx_suffix none (active none), hex_tokens true (active false)\n");
}

TEST(SetCommand, ShowsConfiguredActiveStagedAndStored) {
  InstanceRun instance("rx_suffix=03 gap=50");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  EXPECT_EQ(instance.Loka({"set", "rx_suffix=CR", "gap=60"}).status, 0);
  EXPECT_EQ(instance.Loka({"set", "gap=70", "--stage"}).status, 0);
  const std::string table =
      "setting           configured  active  staged  stored\n"
      "baud              115200      115200  -       -\n"
      "parity            none        none    -       -\n"
      "bits              8           8       -       -\n"
      "stop              1           1       -       -\n"
      "mode              RS-232      RS-232  -       -\n"
      "rx_prefix         none        none    -       -\n"
      "rx_suffix         03          0D      -       0D\n"
      "tx_prefix         none        none    -       -\n"
      "tx_suffix         none        none    -       -\n"
      "gap               50          60      70      60\n"
      "hex_tokens        false       false   -       -\n"
      "token_queue_size  100         100     -       -\n";
  EXPECT_EQ(instance.Output({"set"}), table);
  EXPECT_EQ(instance.Output({"set", "--show"}), table);
  const std::string json = instance.Output({"set", "-j"});
  EXPECT_TRUE(
      Holds(json, R"({"active":"60","configured":"50","key":"gap","staged":"70","stored":"60"})"))
      << json;
}

TEST(SetCommand, WritesJson) {
  InstanceRun instance("");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  EXPECT_EQ(instance.Output({"set", "-j", "gap=30"}),
            R"({"staged":[{"active":"0","key":"gap","value":"30"}]})"
            "\n"
            R"({"applied":[{"key":"gap","previous":"0","value":"30"}],"cleared":0,"stored":true})"
            "\n");
}

// What is staged lives in the driver.
TEST(SetCommand, TellsThatAnInstanceOfItsOwnForgetsWhatIsStaged) {
  InstanceRun instance("");
  instance.Stop();
  const std::vector<std::string> common = {"--port", instance.Line().Path(), "--config",
                                           TestConfiguration("gap=5")};
  std::vector<std::string> stage = {"set", "gap=30", "--stage"};
  stage.insert(stage.end(), common.begin(), common.end());
  const InstanceRun::Result staged = instance.Loka(stage);
  EXPECT_EQ(staged.status, 0);
  EXPECT_TRUE(Holds(staged.errors, "what is staged here goes with this command")) << staged.errors;
  std::vector<std::string> set = {"set", "gap=40"};
  set.insert(set.end(), common.begin(), common.end());
  EXPECT_EQ(instance.Output(set), "staged: gap 40 (active 5)\napplied and stored\n");
  // The next instance runs with the stored value and says so at its start.
  std::vector<std::string> read = {"read", "0?SP_Gap?unsignedInt"};
  read.insert(read.end(), common.begin(), common.end());
  const InstanceRun::Result result = instance.Loka(read);
  EXPECT_EQ(result.output, "40\n");
  EXPECT_TRUE(Holds(result.errors, "stored override: gap 40 instead of 5")) << result.errors;
}

TEST(SetCommand, SaysWhenNothingCouldBeStored) {
  InstanceRun instance("");
  instance.Stop();
  EXPECT_EQ(instance.Output({"set", "gap=40", "--no-store", "--port", instance.Line().Path(),
                             "--config", TestConfiguration("")}),
            "staged: gap 40 (active 0)\napplied, not stored\n");
}

}  // namespace
