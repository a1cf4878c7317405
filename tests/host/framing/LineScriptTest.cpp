// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <fstream>

#include "host/framing/LineScript.h"
#include "host/text/ByteText.h"
#include "tests/host/support/TemporaryFolder.h"

namespace {

std::string Show(const LineScript& script) {
  std::string text;
  for (const LineEvent& event : script) {
    text += event.bytes.empty() ? "[" + std::to_string(event.silenceMs) + "]"
                                : "<" + HexBytes(event.bytes) + ">";
  }
  return text;
}

std::string Read(const std::vector<std::string>& words, bool hasWords = false) {
  LineScript script;
  std::string error;
  return ReadLineScript(words, hasWords, &script, &error) ? Show(script) : error;
}

TEST(LineScript, BytesAndSilences) {
  EXPECT_EQ(Read({"02", "05", "~", "0202", "STX", "~250", "~20ms", "CR"}),
            "<02 05>[0]<02 02 02>[250][20]<0D>");
  EXPECT_EQ(Read({"02 41", "none"}), "<02 41>");
}

TEST(LineScript, WrongWordsAreNamed) {
  EXPECT_EQ(Read({"02", "~x"}), "\"~x\" is no silence; write ~ or ~500 (milliseconds)");
  EXPECT_NE(Read({"02", "~0"}).find("is no silence"), std::string::npos);
  EXPECT_NE(Read({"02", "~9999999999"}).find("is no silence"), std::string::npos);
  EXPECT_NE(Read({"02", "xyz"}).find("\"xyz\" is neither"), std::string::npos);
  // Bytes of a device may come back in a message; they are escaped.
  EXPECT_NE(Read({"02", "\x1B[31m"}).find("\\x1b[31m"), std::string::npos);
}

TEST(LineScript, OneWordMayBeAFile) {
  const TemporaryFolder folder;
  const std::string name = folder.File("capture");
  std::ofstream(name, std::ios::binary) << std::string("~\x02\0#", 4);
  EXPECT_EQ(Read({name}), "<7E 02 00 23>");
  std::ofstream(name, std::ios::binary) << "02 41 # a comment\n~ STX\n";
  EXPECT_EQ(Read({name}, true), "<02 41>[0]<02>");
  EXPECT_NE(Read({folder.File("none")}).find("nor a file that can be read"), std::string::npos);
  EXPECT_NE(Read({folder.File("none")}, true).find("No such file"), std::string::npos);
  EXPECT_NE(Read({folder.Path().string()}).find("Is a directory"), std::string::npos);
}

}  // namespace
