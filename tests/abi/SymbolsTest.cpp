// SPDX-License-Identifier: Apache-2.0
// What the built library exports, and what it needs.
#include <gtest/gtest.h>

#include <algorithm>

#include "tests/abi/SymbolList.h"
#include "tests/support/PluginLibrary.h"

namespace {

using Lines = std::vector<std::string>;

Lines Nm(const std::string& options) {
  return RunCommand(std::string(LOKA_NM) + " -D -C " + options + " '" +
                    PluginLibrary::DefaultPath() + "'");
}

bool Has(const Lines& lines, const std::string& part) {
  return std::any_of(lines.begin(), lines.end(),
                     [&](const std::string& line) { return line.find(part) != std::string::npos; });
}

TEST(SymbolsTest, ExportsTheEntryPointAndTheUtilitiesOnly) {
  const Lines exported = Nm("--defined-only");
  EXPECT_EQ(UnexpectedExports(exported), Lines());
  const std::string text =
      "std::__cxx11::basic_string<char, std::char_traits<char>, std::allocator<char> >";
  const std::string texts = "std::vector<" + text + ", std::allocator<" + text + " > >&";
  const Lines names = {
      "GetInterfaceFactory",
      "ProtUtilsN::GetVADOType(" + text + " const&, ICU_Type&, ICU_Type&, int&, " + texts + ")",
      "ProtUtilsN::GetVADOName[abi:cxx11](ICU_Type, int)",
      "ProtUtilsN::GetDataLength(ICU_Type)",
      "ProtUtilsN::GetTypeFlag(ICU_Type)",
      "ProtUtilsN::IsBitType(ICU_Type)",
      "ProtUtilsN::IsBitType(ITag const*)",
      "ProtUtilsN::GetItemCount(int, ICU_Type)",
      "ProtUtilsN::GetItemCount(ITag const*)",
      "ProtUtilsN::GetBasicType(ITag const*)",
      "ProtUtilsN::GetBasicLength(ITag const*)",
      "ProtUtilsN::GetVersion()",
      "ProtUtilsN::GetLenOfBits(int, int)",
      "ProtUtilsN::UnpackBits(unsigned char*, unsigned char const*, int, int)",
      "ProtUtilsN::PackBits(unsigned char*, unsigned char const*, int, int)",
      "ProtUtilsN::CopyBits(unsigned char*, unsigned char const*, int, int)",
      "ProtUtilsN::shiftBits(unsigned char*, int, unsigned char const*, int, int)",
      "ProtUtilsN::getStartingBit(ITag const*)",
      "ProtUtilsN::getEndingBit(ITag const*)",
      "ProtUtilsN::GetConfigValue(char const*, char const*, " + text + "&)",
      "ProtUtilsN::Trim(" + text + "&)",
      "ProtUtilsN::GetTrim(" + text + " const&)",
      "ProtUtilsN::ParseSubstrings(" + text + " const&, " + texts + ", char)"};
  for (const std::string& name : names) {
    EXPECT_EQ(std::count_if(exported.begin(), exported.end(),
                            [&](const std::string& line) {
                              const std::string end = " T " + name;
                              return line.size() > end.size() &&
                                     line.compare(line.size() - end.size(), end.size(), end) == 0;
                            }),
              1)
        << name;
  }
}

TEST(SymbolsTest, NeedsTheLanguagesLibrariesOnly) {
  const Lines needed = Nm("--undefined-only");
  EXPECT_TRUE(Has(needed, "@GLIBC_")) << "nothing was read";
  EXPECT_EQ(UnexpectedImports(needed), Lines());
}

#ifdef LOKA_READELF
TEST(SymbolsTest, LinksTheLanguagesLibrariesOnly) {
  const Lines lines =
      RunCommand(std::string(LOKA_READELF) + " -d '" + PluginLibrary::DefaultPath() + "'");
  int needed = 0;
  for (const std::string& line : lines) {
    if (line.find("(NEEDED)") == std::string::npos) continue;
    ++needed;
    const bool isKnown = Has({line}, "[libc.so.6]") || Has({line}, "[libstdc++.so.6]") ||
                         Has({line}, "[libm.so.6]") || Has({line}, "[libgcc_s.so.1]") ||
                         Has({line}, "[ld-linux");
    EXPECT_TRUE(isKnown) << line;
  }
  EXPECT_GT(needed, 0) << "nothing was read";
}

// Another driver in the process may export utilities of the same names.
TEST(SymbolsTest, UsesItsOwnUtilities) {
  const Lines relocations =
      RunCommand(std::string(LOKA_READELF) + " -r -W '" + PluginLibrary::DefaultPath() + "'");
  EXPECT_TRUE(Has(relocations, "memcpy")) << "nothing was read";
  EXPECT_FALSE(Has(relocations, "ProtUtilsN"));
}
#endif

// The checks find what they are there for.
TEST(SymbolsTest, StraySymbolsAreFound) {
  EXPECT_EQ(UnexpectedExports({"0000000000001000 T GetInterfaceFactory",
                               "0000000000001010 T ProtUtilsN::Trim(int)",
                               "0000000000001020 R ProtUtilsN::DataTypes"}),
            Lines());
  for (const char* stray :
       {"0000000000001000 T GetInterfaceFactory2", "0000000000001000 V vtable for Protocol_LOKA",
        "0000000000001000 W std::vector<int>::push_back()", "0000000000001000 T ProtUtils::Trim()",
        "0000000000001000 V typeinfo for ProtUtilsN::X", "nonsense"}) {
    EXPECT_EQ(UnexpectedExports({stray}), Lines({stray}));
  }
  EXPECT_EQ(UnexpectedImports({"                 U memcpy@GLIBC_2.14",
                               "                 w __gmon_start__",
                               "                 U operator new(unsigned long)@GLIBCXX_3.4"}),
            Lines());
  for (const char* stray : {"                 U inflate", "                 U inflate@ZLIB_1.2",
                            "                 U Protocol_LOKA::Task()"}) {
    EXPECT_EQ(UnexpectedImports({stray}), Lines({stray}));
  }
}

}  // namespace
