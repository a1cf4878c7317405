// SPDX-License-Identifier: Apache-2.0
// Profiles: the files, and what a command takes from them.
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>

#include "host/commands/ProfileFile.h"
#include "host/commands/ProfileUse.h"
#include "host/port/PseudoTerminal.h"
#include "tests/host/support/ProgramRun.h"
#include "tests/host/support/TextParts.h"

namespace {

class ProfileTest : public ::testing::Test {
 protected:
  // The profiles file of the user.
  void Write(const std::string& text) const {
    std::filesystem::create_directories(folder_.File("loka"));
    std::ofstream(UserFile()) << text;
  }

  std::string UserFile() const { return folder_.File("loka/config.toml"); }

  std::string ErrorOf(const std::string& text) const {
    Write(text);
    std::vector<Profile> profiles;
    std::string error;
    return ReadProfiles({UserFile()}, &profiles, &error) ? "none" : error;
  }

  std::unique_ptr<ProgramRun> Begin(const std::vector<std::string>& arguments,
                                    const std::string& more = "") const {
    return std::make_unique<ProgramRun>(
        arguments, "XDG_CONFIG_HOME='" + folder_.Path().string() + "' " + more);
  }

  const TemporaryFolder folder_;
};

TEST_F(ProfileTest, ReadsSectionsInOrder) {
  Write("# bench\n[scale]\nport = \"com1=/dev/a,latency=low\"\nbaudrate=9600\n\n[gate]\ngap=5\n");
  std::vector<Profile> profiles;
  std::string error;
  ASSERT_TRUE(ReadProfiles({folder_.File("absent"), UserFile()}, &profiles, &error)) << error;
  EXPECT_EQ(ProfileNames(profiles), "scale, gate");
  const Profile* const scale = FindProfile(profiles, "scale");
  ASSERT_NE(scale, nullptr);
  using Values = std::vector<std::pair<std::string, std::string>>;
  EXPECT_EQ(scale->values, (Values{{"port", "com1=/dev/a,latency=low"}, {"baudrate", "9600"}}));
  EXPECT_EQ(scale->file, UserFile());
}

TEST_F(ProfileTest, TheFirstFileCountsSectionBySection) {
  Write("[scale]\ngap=1\n");
  std::ofstream(folder_.File("system.toml")) << "[scale]\ngap=2\nqueue=3\n[gate]\ngap=4\n";
  std::vector<Profile> profiles;
  std::string error;
  ASSERT_TRUE(ReadProfiles({UserFile(), folder_.File("system.toml")}, &profiles, &error)) << error;
  ASSERT_EQ(profiles.size(), 2U);
  EXPECT_EQ(profiles[0].values.size(), 1U);
  EXPECT_EQ(profiles[0].values[0].second, "1");
  EXPECT_EQ(profiles[1].file, folder_.File("system.toml"));
}

TEST_F(ProfileTest, SaysWhatIsWrongWithAFile) {
  const std::string file = UserFile();
  EXPECT_EQ(ErrorOf("gap=5\n"),
            file + ": gap stands in no section; a profile begins with its name, as in [scale]");
  EXPECT_EQ(ErrorOf("[a b]\ngap=5\n"),
            file + ": [a b] is no name of a profile: letters, digits, _ and - make one");
  EXPECT_EQ(
      ErrorOf("[a]\nport=/dev/x,flow=none\n"),
      file + ": [a] port has several values; put one with a comma or a blank in it in quotes");
  EXPECT_EQ(ErrorOf("[a]\ngap=5\nbaud=300\ngap=6\n"), file + ": [a] gap is given twice");
  EXPECT_EQ(ErrorOf("[a]\nident=\"a#b\"\n"), file + ": [a] ident has a quote or a # in its value");
  EXPECT_EQ(ErrorOf("[a]\ngap=5\n"), "none");
  std::vector<Profile> profiles;
  std::string error;
  EXPECT_FALSE(ReadProfiles({folder_.Path().string()}, &profiles, &error));
  EXPECT_EQ(error, folder_.Path().string() + " cannot be read");
}

TEST_F(ProfileTest, ChecksKeysAndValues) {
  std::string error;
  EXPECT_TRUE(CheckProfile({"a",
                            "f",
                            {{"port", "/dev/x"},
                             {"baudrate", "9600"},
                             {"bits", "7"},
                             {"stopbits", "2"},
                             {"parity", "mark"},
                             {"mode", "RS-485"},
                             {"rx_prefix", "STX"},
                             {"rx-suffix", "CR LF"},
                             {"gap", "5"},
                             {"hex_tokens", "false"},
                             {"token_queue_size", "1"},
                             {"autoConnect", "false"},
                             {"no-store", "true"},
                             {"plugin", "x.so"}}},
                           &error))
      << error;
  EXPECT_FALSE(CheckProfile({"a", "f", {{"baudrat", "9600"}}}, &error));
  EXPECT_EQ(error, "f: [a] baudrat: no such key; loka-config(5) lists them");
  EXPECT_FALSE(CheckProfile({"a", "f", {{"help", "true"}}}, &error));
  EXPECT_FALSE(CheckProfile({"a", "f", {{"profile", "b"}}}, &error));
  EXPECT_FALSE(CheckProfile({"a", "f", {{"bits", "9"}}}, &error));
  EXPECT_TRUE(Holds(error, "f: [a] bits: ")) << error;
  EXPECT_FALSE(CheckProfile({"a", "f", {{"autoConnect", "maybe"}}}, &error));
  EXPECT_EQ(error, "f: [a] autoConnect: \"maybe\" is none of true, false");
  EXPECT_FALSE(CheckProfile({"a", "f", {{"store", "x"}, {"no-store", "true"}}}, &error));
  EXPECT_TRUE(Holds(error, "f: [a] no-store: contradicts --store")) << error;
}

TEST_F(ProfileTest, StandsForThePort) {
  const PseudoTerminal line;
  Write("[scale]\nport = " + line.Path() +
        "\nbaudrate = 19200\nparity = none\nrx_suffix = ETX\nhex_tokens = true\n");
  for (const std::vector<std::string>& words :
       {std::vector<std::string>{"sub", "scale", "-C", "1"},
        std::vector<std::string>{"sub", "--profile", "scale", "-C", "1"},
        std::vector<std::string>{"--profile", "scale", "sub", "-C", "1"}}) {
    const auto run = Begin(words);
    ASSERT_TRUE(run->AwaitErrors("hex tokens on")) << run->Errors();
    EXPECT_TRUE(Holds(run->Errors(), "profile scale of " + UserFile())) << run->Errors();
    EXPECT_TRUE(Holds(run->Errors(), "19200 8N1")) << run->Errors();
    ASSERT_TRUE(line.Send("A\x03", Deadline::After(ProgramRun::kLimitMs)));
    EXPECT_EQ(run->Output(), "A\n");
    EXPECT_EQ(run->Status(), 0);
  }
}

TEST_F(ProfileTest, TheCommandLineCountsMore) {
  const PseudoTerminal line;
  Write("[scale]\nport = /dev/absent\nbaudrate = 19200\nparity = none\nno-store = true\n");
  const auto flags = Begin({"sub", "--profile", "scale", "-b", "300", "--port", line.Path(),
                            "--store", folder_.File("own.db")});
  EXPECT_TRUE(flags->AwaitErrors("300 8N1")) << flags->Errors();
  flags->Signal(SIGTERM);
  EXPECT_EQ(flags->Status(), 128 + SIGTERM);
  EXPECT_TRUE(std::filesystem::exists(folder_.File("own.db")));
  // A configuration of the command line is taken as it is.
  const auto text =
      Begin({"sub", "--profile", "scale", line.Path(), "--config",
             "CfgVer=1 model=1 port=com1 baudrate=600 parity=odd bits=8 stopbits=1 mode=RS-232"});
  EXPECT_TRUE(text->AwaitErrors("600 8O1")) << text->Errors();
  text->Signal(SIGTERM);
  EXPECT_EQ(text->Status(), 128 + SIGTERM);
}

TEST_F(ProfileTest, CountsMoreThanTheEnvironment) {
  const PseudoTerminal line;
  Write("[scale]\nport = " + line.Path() + "\nparity = none\n");
  const auto profile = Begin({"sub", "scale"}, "LOKA_PORT=/dev/absent");
  EXPECT_TRUE(profile->AwaitErrors("9600 8N1")) << profile->Errors();
  profile->Signal(SIGTERM);
  EXPECT_EQ(profile->Status(), 128 + SIGTERM);
  const auto environment = Begin({"sub", "-b", "300"}, "LOKA_PORT=com1='" + line.Path() + "'");
  EXPECT_TRUE(environment->AwaitErrors("300 8E1")) << environment->Errors();
  environment->Signal(SIGTERM);
  EXPECT_EQ(environment->Status(), 128 + SIGTERM);
}

TEST_F(ProfileTest, SaysWhichThereAre) {
  Write("[scale]\nport = /dev/x\n[gate]\ngap = x\n");
  const auto word = Begin({"sub", "scael"});
  EXPECT_EQ(word->Status(), 2);
  EXPECT_TRUE(
      Holds(word->Errors(), "'scael' is neither a port nor a profile; profiles: scale, gate"))
      << word->Errors();
  const auto option = Begin({"tags", "--profile", "scael"});
  EXPECT_EQ(option->Status(), 2);
  EXPECT_TRUE(Holds(option->Errors(), "there is no profile 'scael'; profiles: scale, gate"))
      << option->Errors();
  const auto wrong = Begin({"sub", "gate"});
  EXPECT_EQ(wrong->Status(), 2);
  EXPECT_TRUE(Holds(wrong->Errors(), UserFile() + ": [gate] gap: ")) << wrong->Errors();
  const auto list = Begin({"config", "profiles"});
  EXPECT_EQ(list->Output(),
            "scale  " + UserFile() + "  port=/dev/x\ngate  " + UserFile() + "  gap=x\n");
  EXPECT_EQ(list->Status(), 2);
  EXPECT_TRUE(Holds(list->Errors(), ": [gate] gap: ")) << list->Errors();
}

TEST(ProfileFiles, StandInTheFoldersOfUserAndSystem) {
  const char* const former = std::getenv("XDG_CONFIG_HOME");
  const std::string kept = former == nullptr ? "" : former;
  ASSERT_EQ(setenv("XDG_CONFIG_HOME", "/x", 1), 0);
  EXPECT_EQ(ProfileFiles(),
            (std::vector<std::string>{"/x/loka/config.toml", "/etc/loka/config.toml"}));
  ASSERT_EQ(setenv("XDG_CONFIG_HOME", "relative", 1), 0);
  EXPECT_EQ(ProfileFiles().back(), "/etc/loka/config.toml");
  EXPECT_NE(ProfileFiles().front().find("/.config/loka/config.toml"), std::string::npos);
  ASSERT_EQ(
      former == nullptr ? unsetenv("XDG_CONFIG_HOME") : setenv("XDG_CONFIG_HOME", kept.c_str(), 1),
      0);
}

}  // namespace
