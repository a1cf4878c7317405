// SPDX-License-Identifier: Apache-2.0
// The order of the folders, read from the include lines.
#include <gtest/gtest.h>

#include "tests/abi/IncludeRules.h"

namespace {

using Lines = std::vector<std::string>;

FileIncludes One(const std::string& file, const std::string& line) {
  return {{file, ParseIncludes(line)}};
}

TEST(IncludeRulesTest, TheTreeKeepsTheRules) {
  const FileIncludes files = ReadTree(LOKA_SOURCE_DIR);
  EXPECT_EQ(BrokenRules(files), Lines());
}

// A check that reads nothing finds nothing; these must have been read.
TEST(IncludeRulesTest, TheTreeIsRead) {
  const FileIncludes files = ReadTree(LOKA_SOURCE_DIR);
  for (const char* file : {"interfaces/IProtocol.h", "factory/ProtocolFactory.cpp",
                           "tests/plugin/PluginFixture.h", "tests/support/ScriptedHost.cpp"}) {
    ASSERT_EQ(files.count(file), 1U) << file;
    EXPECT_FALSE(files.at(file).empty()) << file;
  }
  for (const char* folder : {"interfaces/", "protlib/", "model/", "driver/", "factory/"}) {
    const auto first = files.lower_bound(folder);
    EXPECT_TRUE(first != files.end() &&
                first->first.compare(0, std::string(folder).size(), folder) == 0)
        << folder;
  }
}

TEST(IncludeRulesTest, IncludeLinesAreRecognised) {
  const auto includes = ParseIncludes(
      "#include \"a/b.h\"\n  #  include <vector>\n// #include \"c.h\"\nint x; // #include <y>\n"
      "#include\"d.h\" // why\n");
  ASSERT_EQ(includes.size(), 3U);
  EXPECT_EQ(includes[0].target, "a/b.h");
  EXPECT_TRUE(includes[0].quoted);
  EXPECT_EQ(includes[1].target, "vector");
  EXPECT_FALSE(includes[1].quoted);
  EXPECT_EQ(includes[2].target, "d.h");
}

// Each rule finds what it is there for.
TEST(IncludeRulesTest, BreachesAreFound) {
  const struct {
    const char* file;
    const char* line;
  } breaches[] = {{"interfaces/X.h", "#include \"protlib/X.h\""},
                  {"interfaces/X.h", "#include <unistd.h>"},
                  {"protlib/X.cpp", "#include \"model/X.h\""},
                  {"protlib/X.cpp", "#include <sys/time.h>"},
                  {"protlib/SystemClock.h", "#include <sys/time.h>"},
                  {"model/X.cpp", "#include \"driver/X.h\""},
                  {"driver/X.cpp", "#include \"factory/X.h\""},
                  {"driver/X.cpp", "#include \"host/X.h\""},
                  {"driver/X.cpp", "#include \"X.h\""},
                  {"driver/X.cpp", "#include \"Xml_LOKA_stream.h\""},
                  {"driver/X.cpp", "#include <pthread.h>"},
                  {"factory/InterfaceFactory.cpp", "#include \"driver/Protocol_LOKA.h\""},
                  {"factory/ProtocolFactory.h", "#include \"driver/Protocol_LOKA.h\""},
                  {"host/X.cpp", "#include \"protlib/X.h\""},
                  {"host/X.cpp", "#include \"driver/X.h\""},
                  {"tests/plugin/X.cpp", "#include \"driver/X.h\""},
                  {"tests/plugin/X.cpp", "#include \"protlib/ProtUtilsN.h\""},
                  {"tests/support/X.cpp", "#include \"model/X.h\""},
                  {"tests/abi/X.cpp", "#include \"factory/X.h\""},
                  {"tests/host/X.cpp", "#include \"driver/X.h\""},
                  {"elsewhere/X.cpp", "#include <vector>"}};
  for (const auto& breach : breaches) {
    EXPECT_EQ(BrokenRules(One(breach.file, breach.line)).size(), 1U)
        << breach.file << ": " << breach.line;
  }
}

TEST(IncludeRulesTest, WhatIsAllowedIsNoBreach) {
  const struct {
    const char* file;
    const char* line;
  } allowed[] = {{"interfaces/X.h", "#include <cstdint>"},
                 {"protlib/SystemClock.cpp", "#include <sys/time.h>"},
                 {"driver/X.cpp", "#include \"model/X.h\""},
                 {"factory/ProtocolFactory.cpp", "#include \"driver/Protocol_LOKA.h\""},
                 {"host/X.cpp", "#include <termios.h>"},
                 {"tests/host/X.cpp", "#include \"host/X.h\""},
                 {"tests/plugin/X.cpp", "#include \"tests/support/X.h\""}};
  for (const auto& example : allowed) {
    EXPECT_EQ(BrokenRules(One(example.file, example.line)), Lines()) << example.file;
  }
}

TEST(IncludeRulesTest, CyclesAreFound) {
  FileIncludes files;
  files["driver/A.h"] = ParseIncludes("#include \"driver/B.h\"");
  files["driver/B.h"] = ParseIncludes("#include \"driver/C.h\"");
  files["driver/C.h"] = {};
  EXPECT_EQ(BrokenRules(files), Lines());
  files["driver/C.h"] = ParseIncludes("#include \"driver/B.h\"");
  EXPECT_EQ(BrokenRules(files), Lines({"cycle: driver/B.h driver/C.h"}));
}

}  // namespace
