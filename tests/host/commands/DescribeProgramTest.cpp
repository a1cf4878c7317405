// SPDX-License-Identifier: Apache-2.0
// loka describe, run as a program.
#include <gtest/gtest.h>

#include <filesystem>
#include <nlohmann/json.hpp>
#include <pugixml.hpp>
#include <regex>
#include <sstream>

#include "host/text/Utf8Text.h"
#include "tests/host/document/FakeLibrary.h"
#include "tests/host/support/ProgramRun.h"
#include "tests/host/support/TextParts.h"

namespace {

using Json = nlohmann::json;

// What a run prints; it must succeed without a word on stderr.
std::string Result(const std::vector<std::string>& arguments) {
  ProgramRun run(arguments);
  std::string output = run.Output();
  EXPECT_EQ(run.Status(), 0);
  EXPECT_EQ(run.Errors(), "");
  return output;
}

// The error of a file that holds these bytes.
std::string ErrorOf(const std::string& bytes) {
  const TemporaryFolder folder;
  std::string errors;
  for (const char* form : {"--xml", "--json", ""}) {
    std::vector<std::string> arguments = {"describe", WriteAll(folder.File("lib.so"), bytes)};
    if (*form != '\0') {
      arguments.emplace_back(form);
    }
    ProgramRun run(arguments);
    EXPECT_EQ(run.Output(), "");
    EXPECT_EQ(run.Status(), 3);
    errors = run.Errors();
    EXPECT_EQ(errors.rfind("loka: ", 0), 0U) << errors;
  }
  return errors;
}

TEST(DescribeProgram, SummaryNamesKeysAndMemoryTypes) {
  const std::string text = Result({"describe"});
  EXPECT_EQ(text.rfind("LOKA  Loka Serial  version 111  code 471\n", 0), 0U) << text;
  EXPECT_TRUE(std::regex_search(text, std::regex("\n  baudrate +9600 +yes +Baudrate +150 300 ")));
  EXPECT_TRUE(std::regex_search(text, std::regex("\n  token_queue_size +100 +no .* 1 to 10000\n")));
  EXPECT_TRUE(std::regex_search(
      text, std::regex("\n  rx_token +read +byte +0x200 +0 to 999999999 +Token Received\n")));
  EXPECT_TRUE(std::regex_search(text, std::regex("\n  token_ack +write ")));
  EXPECT_TRUE(std::regex_search(text, std::regex("\n  connect +read, write ")));
}

TEST(DescribeProgram, XmlIsTheDocumentByteForByte) {
  const std::string stream = StreamOf(PluginBlock());
  for (const std::vector<std::string>& arguments :
       {std::vector<std::string>{"describe", "--xml"},
        {"describe", PluginLibrary::DefaultPath(), "--xml"}}) {
    const std::string xml = Result(arguments);
    EXPECT_EQ(Compress(xml), stream);
    EXPECT_TRUE(IsUtf8(xml));
    pugi::xml_document document;
    EXPECT_TRUE(document.load_string(xml.c_str()));
    EXPECT_EQ(xml.rfind("<?xml version=\"1.0\" encoding=\"utf-8\"?>\n<protocol_cfg>\n  <", 0), 0U);
    std::istringstream lines(xml);
    for (std::string line; std::getline(lines, line);) {
      EXPECT_TRUE(std::regex_search(line, std::regex("^(  )*<[^ ].*>$"))) << line;
    }
  }
}

TEST(DescribeProgram, JsonHoldsWhatTheDocumentSays) {
  const Json json = Json::parse(Result({"describe", PluginLibrary::DefaultPath(), "--json"}));
  EXPECT_EQ(json["module"], Json({{"name", "LOKA"},
                                  {"fullName", "Loka Serial"},
                                  {"version", 111},
                                  {"platform", "QM77_LIN"}}));
  EXPECT_EQ(json["properties"]["code"], 471);
  EXPECT_EQ(json["properties"]["usesUart"], true);
  EXPECT_EQ(json["parameters"].size(), 16U);
  EXPECT_EQ(json["parameters"][3]["key"], "baudrate");
  EXPECT_EQ(json["parameters"][3]["entries"].size(), 11U);
  EXPECT_EQ(json["memoryTypes"].size(), 19U);
  EXPECT_EQ(json["memoryTypes"][0]["name"], "tx_token");
  EXPECT_EQ(json["memoryTypes"][0].size(), 18U);
  EXPECT_EQ(json["tagFields"].size(), 3U);
  EXPECT_EQ(json["models"][0]["memoryTypes"].size(), 19U);
  // Loaded or searched, the description is the same; only the platform is not told when loaded.
  Json loaded = Json::parse(Result({"describe", "--json"}));
  EXPECT_EQ(loaded["module"]["platform"], nullptr);
  loaded["module"]["platform"] = "QM77_LIN";
  EXPECT_EQ(loaded, json);
}

TEST(DescribeProgram, LibraryOfAnotherArchitecture) {
  const TemporaryFolder folder;
  const std::string file = WriteAll(folder.File("libARM.so"), ArmLibrary(PluginBlock()));
  EXPECT_EQ(Compress(Result({"describe", file, "--xml"})), StreamOf(PluginBlock()));
  EXPECT_TRUE(Holds(Result({"describe", file}), "version 111  code 471  platform QM77_LIN\n"));
  ProgramRun load({"describe", "--plugin", file});
  EXPECT_EQ(load.Status(), 3);
  EXPECT_TRUE(Holds(load.Errors(), "cannot load the plug-in")) << load.Errors();
  EXPECT_TRUE(Holds(load.Errors(), "loka describe FILE reads a library")) << load.Errors();
}

TEST(DescribeProgram, DocumentWithoutLastLineFeedGetsNone) {
  const TemporaryFolder folder;
  std::string document = SmallDocument();
  document.pop_back();
  const std::string file = WriteAll(folder.File("lib.so"), BlockOf(Compress(document)));
  // A file of its own: reading by lines would not show the difference.
  const std::string out = folder.File("out");
  ProgramRun run({"describe", "--xml", file}, "sh -c 'exec \"$0\" \"$@\" >" + out + "'");
  EXPECT_EQ(run.Status(), 0) << run.Errors();
  EXPECT_EQ(ReadAll(out), document);
}

TEST(DescribeProgram, DamagedFilesAreStatus3) {
  EXPECT_TRUE(Holds(ErrorOf(""), "lib.so: no description here; expected a driver library"));
  EXPECT_TRUE(Holds(ErrorOf(std::string(100000, '\xA5')), "no description here"));
  const std::string library = ArmLibrary(PluginBlock());
  const std::size_t block = library.find("<<VADO_XML_START>>");
  EXPECT_TRUE(Holds(ErrorOf(library.substr(0, block + 40)), "the description is damaged"));
  EXPECT_TRUE(Holds(ErrorOf(library.substr(0, block + 500)), "expected the end marker"));
  std::string changed = library;
  changed[block + 600] = static_cast<char>(changed[block + 600] ^ 1);
  EXPECT_TRUE(Holds(ErrorOf(changed), "no whole zlib stream")) << ErrorOf(changed);
}

TEST(DescribeProgram, DocumentsThatAreNoneAreStatus3) {
  EXPECT_TRUE(Holds(ErrorOf(BlockOf(Compress("<a>"))), "no well-formed XML"));
  EXPECT_TRUE(Holds(ErrorOf(BlockOf(Compress("<a/>"))), "expected the root element protocol_cfg"));
  EXPECT_TRUE(Holds(ErrorOf(BlockOf(Compress("<a>\xFF</a>"))), "no XML text in UTF-8"));
  EXPECT_TRUE(Holds(ErrorOf(BlockOf(Compress(std::string(50000000, ' ')))), "inflates to more"));
}

TEST(DescribeProgram, FilesThatAreNotThereAreStatus3) {
  const TemporaryFolder folder;
  ProgramRun absent({"describe", folder.File("absent.so")});
  EXPECT_EQ(absent.Status(), 3);
  EXPECT_EQ(absent.Errors(), "loka: " + folder.File("absent.so") + ": No such file or directory\n");
  ProgramRun device({"describe", "/dev/zero"});
  EXPECT_EQ(device.Status(), 3);
  EXPECT_TRUE(Holds(device.Errors(), "this is no file")) << device.Errors();
  const std::string huge = WriteAll(folder.File("huge.so"), "x");
  std::filesystem::resize_file(huge, 1UL << 36U);
  ProgramRun tooLarge({"describe", huge});
  EXPECT_EQ(tooLarge.Status(), 3);
  EXPECT_TRUE(Holds(tooLarge.Errors(), "too large for a driver library")) << tooLarge.Errors();
  ProgramRun plugin({"describe", "--plugin", "/nowhere/lib.so"});
  EXPECT_EQ(plugin.Status(), 3);
}

TEST(DescribeProgram, WrongUsageIsStatus2) {
  for (const std::vector<std::string>& arguments :
       {std::vector<std::string>{"describe", "--xml", "--json"},
        {"describe", "a.so", "--plugin", "b.so"},
        {"describe", "a.so", "b.so"},
        {"describe", "--bogus"}}) {
    ProgramRun run(arguments);
    EXPECT_EQ(run.Output(), "");
    EXPECT_EQ(run.Status(), 2);
    EXPECT_NE(run.Errors(), "");
  }
}

TEST(DescribeProgram, ResultThatCannotBeWrittenIsStatus1) {
  ProgramRun run({"describe", "--xml"}, R"(sh -c 'exec "$0" "$@" >/dev/full')");
  EXPECT_EQ(run.Status(), 1);
  EXPECT_TRUE(Holds(run.Errors(), "cannot write the result: No space left")) << run.Errors();
}

}  // namespace
