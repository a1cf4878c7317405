// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>
#include <sstream>

#include "tests/host/commands/InstanceRun.h"
#include "tests/host/support/TestLimit.h"
#include "tests/host/support/TextParts.h"

namespace {

using Json = nlohmann::json;

constexpr const char* kBaudUri = "0?SP_Baud?unsignedInt";

std::vector<Json> JsonLines(const std::string& text) {
  std::vector<Json> lines;
  std::istringstream stream(text);
  for (std::string line; std::getline(stream, line);) {
    lines.push_back(Json::parse(line));
  }
  return lines;
}

TEST(TagsCommand, ShowsEveryMemoryTypeWithItsValue) {
  InstanceRun instance("rx_prefix=02 rx_suffix=03");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  ASSERT_TRUE(
      instance.DeviceSends("\x02"
                           "A\x1B\x03",
                           "1"));
  const InstanceRun::Result tags = instance.Loka({"tags"});
  EXPECT_EQ(tags.status, 0);
  for (const char* const row : {"tag                              access       value\n",
                                "0?tx_token?string-1024           write        -\n",
                                "0?rx_token?string-4096           read         A\\x1b\n",
                                "0?rx_token_len?unsignedInt       read         2\n",
                                "0?tokens_available?unsignedInt   read         1\n",
                                "0?connect?boolean                read, write  1\n",
                                "0?SP_RxPrefix?string-4096        read, write  02\n"}) {
    EXPECT_TRUE(Holds(tags.output, row)) << row << tags.output;
  }
  EXPECT_TRUE(Holds(tags.errors, "attached to the running instance com1 (process ")) << tags.errors;
}

TEST(TagsCommand, WritesJson) {
  InstanceRun instance("rx_suffix=03");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  ASSERT_TRUE(instance.DeviceSends("A\xFF\x03", "1"));
  const std::vector<Json> rows = JsonLines(instance.Output({"tags", "-j", "-q"}));
  ASSERT_EQ(rows.size(), 19U);
  EXPECT_EQ(rows[0],
            Json({{"uri", "0?tx_token?string-1024"}, {"name", "tx_token"}, {"access", "write"}}));
  EXPECT_EQ(rows[1]["hex"], "41FF");
  EXPECT_EQ(rows[3]["value"], "1");
}

TEST(TagsCommand, StartsAnInstanceOfItsOwn) {
  InstanceRun instance("");
  instance.Stop();
  const std::string configuration = TestConfiguration("gap=7 autoConnect=false");
  const InstanceRun::Result tags =
      instance.Loka({"tags", instance.Line().Path(), "--config", configuration});
  EXPECT_EQ(tags.status, 0) << tags.errors;
  EXPECT_TRUE(Holds(tags.output, "0?SP_Gap?unsignedInt             read, write  7\n"))
      << tags.output;
  // It shows the driver as it is configured and opens no port for that.
  EXPECT_TRUE(Holds(tags.output, "0?connect?boolean                read, write  0\n"))
      << tags.output;
  EXPECT_EQ(instance.Loka({"tags"}).status, 2);
  EXPECT_EQ(instance.Loka({"tags", "--attach"}).status, 5);
}

TEST(ReadCommand, PrintsOneValueALine) {
  InstanceRun instance("rx_suffix=03");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  ASSERT_TRUE(instance.DeviceSends("A\n\\B\x03", "1"));
  EXPECT_EQ(
      instance.Output({"read", "0?tokens_available?unsignedInt", "0?rx_token?string-64", kBaudUri}),
      "1\nA\\n\\\\B\n115200\n");
  EXPECT_EQ(instance.Output({"read", "-x", "0?rx_token?string-64"}), "41 0A 5C 42\n");
  EXPECT_EQ(instance.Output({"read", "-j", "0?rx_token?string-64"}),
            R"({"uri":"0?rx_token?string-64","value":"A\n\\B","hex":"410A5C42"})"
            "\n");
}

TEST(ReadCommand, SaysHowLongTheTagMustBe) {
  InstanceRun instance("rx_suffix=03");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  ASSERT_TRUE(instance.DeviceSends("ST,GS+  5.12kg\x03", "1"));
  const InstanceRun::Result read = instance.Loka({"read", "-q", "0?rx_token?string-8"});
  EXPECT_EQ(read.status, 1);
  EXPECT_EQ(read.output, "");
  EXPECT_EQ(read.errors,
            "loka: error -1: token too long   hint: 14 bytes waiting, use string-15 or longer\n");
  EXPECT_EQ(instance.Output({"read", "0?rx_token?string-15"}), "ST,GS+  5.12kg\n");
  // The other tags are read all the same.
  const InstanceRun::Result both =
      instance.Loka({"read", "-j", "-q", "0?rx_token?string-14", "0?rx_token_len?unsignedInt"});
  EXPECT_EQ(both.status, 1);
  EXPECT_EQ(both.output, R"({"uri":"0?rx_token?string-14","error":-1,"text":"token too long",)"
                         R"("hints":["14 bytes waiting, use string-15 or longer"]})"
                         "\n"
                         R"({"uri":"0?rx_token_len?unsignedInt","value":"14","hex":"3134"})"
                         "\n");
}

TEST(ReadCommand, CountsHexCharactersInHexMode) {
  InstanceRun instance("rx_suffix=03 hex_tokens=true");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  ASSERT_TRUE(instance.DeviceSends("ABC\x03", "1"));
  EXPECT_TRUE(Holds(instance.Loka({"read", "0?rx_token?string-6"}).errors,
                    "6 bytes waiting, use string-7 or longer"));
  EXPECT_EQ(instance.Output({"read", "0?rx_token?string-7"}), "414243\n");
}

TEST(ReadCommand, HintsAtTheZeroByteThatCutsAToken) {
  InstanceRun instance("rx_suffix=03");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  ASSERT_TRUE(instance.DeviceSends(std::string("AB\0CD\x03", 6), "1"));
  const InstanceRun::Result read = instance.Loka({"read", "-q", "0?rx_token?string-64"});
  EXPECT_EQ(read.status, 0);
  EXPECT_EQ(read.output, "AB\n");
  EXPECT_EQ(read.errors,
            "loka: the token has 5 bytes and a zero byte behind the first 2; a text tag ends "
            "there\nloka: with hex_tokens=true tokens are hexadecimal text and may hold every "
            "byte\n");
}

TEST(ReadCommand, ExplainsTagAddresses) {
  InstanceRun instance("");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  const InstanceRun::Result noType = instance.Loka({"read", "tokens_available"});
  EXPECT_EQ(noType.status, 1);
  EXPECT_TRUE(Holds(noType.errors, "there must be 3 tag specification fields")) << noType.errors;
  EXPECT_TRUE(Holds(noType.errors, "NODE?MEMORYTYPE?DATATYPE")) << noType.errors;
  const InstanceRun::Result wrongName = instance.Loka({"read", "0?Connect?boolean"});
  EXPECT_TRUE(Holds(wrongName.errors, "Can't access memory type   hint: loka tags lists"))
      << wrongName.errors;
}

TEST(WriteCommand, SendsAndStagesAndSaysWhatWasStaged) {
  InstanceRun instance("tx_prefix=02 tx_suffix=03");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  EXPECT_EQ(instance.Output({"write", "0?tx_token?string-20", "R1"}), "");
  std::string sent;
  EXPECT_TRUE(instance.Line().Receive(4, Deadline::After(kLimitMs), &sent));
  EXPECT_EQ(sent, "\x02R1\x03");
  EXPECT_EQ(instance.Output({"write", "-x", "0?tx_token?string-20", "ESC 41"}), "");
  sent.clear();
  EXPECT_TRUE(instance.Line().Receive(4, Deadline::After(kLimitMs), &sent));
  EXPECT_EQ(sent, "\x02\x1B\x41\x03");
  EXPECT_EQ(instance.Output({"write", kBaudUri, "9600"}), "staged: baud 9600 (active 115200)\n");
  EXPECT_EQ(instance.Output({"write", "-j", "0?SP_Par?unsignedByte", "4"}),
            R"({"active":"none","key":"parity","uri":"0?SP_Par?unsignedByte","value":"space"})"
            "\n");
}

TEST(WriteCommand, CountsTheTokensThatSpDoneClears) {
  InstanceRun instance("rx_suffix=03");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  EXPECT_EQ(instance.Output({"write", "0?SP_Done?boolean", "1"}), "nothing was staged\n");
  ASSERT_TRUE(instance.DeviceSends("A\x03", "1"));
  EXPECT_EQ(instance.Output({"write", "0?SP_Gap?unsignedInt", "40"}),
            "staged: gap 40 (active 0)\n");
  EXPECT_EQ(instance.Output({"write", "0?SP_Done?boolean", "1"}),
            "applied and stored; 1 waiting token cleared\n");
  EXPECT_EQ(instance.Output({"read", "0?tokens_available?unsignedInt"}), "0\n");
  ASSERT_TRUE(
      instance.DeviceSends("A\x03"
                           "B\x03",
                           "2"));
  const InstanceRun::Result done = instance.Loka({"write", "-j", "-q", "0?SP_Done?boolean", "1"});
  EXPECT_EQ(Json::parse(done.output)["cleared"], 2);
  EXPECT_EQ(done.errors, "loka: 2 waiting tokens cleared: SP_Done empties the queue\n");
}

// The driver gives no text for these.
TEST(WriteCommand, NamesTheValuesThatTheDriverRefusesWithoutAWord) {
  InstanceRun instance("");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  struct Refused {
    const char* uri;
    const char* value;
    const char* allowed;
  };
  for (const Refused& refused :
       {Refused{"0?SP_Par?unsignedByte", "5", "parity is none, even, odd, mark or space"},
        Refused{"0?SP_Bits?unsignedByte", "6", "bits is 7 or 8"},
        Refused{"0?SP_Stop?unsignedByte", "3", "stop is 1 or 2"},
        Refused{"0?SP_Mode?unsignedByte", "3", "mode is RS-232, RS-485 or RS-422"}}) {
    for (int attempt = 0; attempt < 2; ++attempt) {
      const InstanceRun::Result write = instance.Loka({"write", "-q", refused.uri, refused.value});
      EXPECT_EQ(write.status, 1);
      EXPECT_EQ(write.errors, std::string("loka: the driver refuses the value\nloka: hint: ") +
                                  refused.allowed + "\n");
    }
    // An earlier text does not stand in for the missing one.
    EXPECT_EQ(instance.Loka({"read", "bogus"}).status, 1);
  }
}

TEST(WriteCommand, GivesTheDriversTextEveryTime) {
  InstanceRun instance("");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  for (int attempt = 0; attempt < 2; ++attempt) {
    const InstanceRun::Result write =
        instance.Loka({"write", "-q", "0?SP_RxPrefix?string-8", "0G"});
    EXPECT_EQ(write.status, 1);
    EXPECT_EQ(write.errors,
              "loka: error -1: Rx prefix value is not hex format   hint: rx_prefix is an even "
              "number of hexadecimal digits or none\n");
  }
  EXPECT_TRUE(Holds(instance.Loka({"write", "0?rx_token?string-8", "x"}).errors,
                    "error -1: writing to read_only type"));
}

TEST(WriteCommand, RefusesWhatTheTagCannotHold) {
  InstanceRun instance("");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  const InstanceRun::Result number = instance.Loka({"write", kBaudUri, "fast"});
  EXPECT_EQ(number.status, 2);
  EXPECT_TRUE(Holds(number.errors, "expected a number from 0 to 4294967295, not \"fast\""))
      << number.errors;
  const InstanceRun::Result text = instance.Loka({"write", "0?tx_token?string-3", "ABC"});
  EXPECT_EQ(text.status, 2);
  EXPECT_TRUE(Holds(text.errors, "the text has 3 bytes and needs string-4 or longer"))
      << text.errors;
  const InstanceRun::Result zero = instance.Loka({"write", "-x", "0?tx_token?string-9", "41 00"});
  EXPECT_EQ(zero.status, 2);
  EXPECT_TRUE(Holds(zero.errors, "a text tag ends at the first zero byte")) << zero.errors;
  EXPECT_EQ(instance.Loka({"write", "-x", kBaudUri, "4"}).status, 2);
}

TEST(WriteCommand, WarnsWhenConnectIsWrittenTwice) {
  InstanceRun instance("tx_prefix=02 tx_suffix=03");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  const InstanceRun::Result again = instance.Loka({"write", "-q", "0?connect?boolean", "1"});
  EXPECT_EQ(again.status, 0);
  EXPECT_EQ(again.errors,
            "loka: the port was connected already: the driver has sent the byte 01 in a frame\n");
  std::string sent;
  EXPECT_TRUE(instance.Line().Receive(3, Deadline::After(kLimitMs), &sent));
  EXPECT_EQ(sent, "\x02\x01\x03");
  // Any spelling of off closes it, without that hint.
  const InstanceRun::Result off = instance.Loka({"write", "-q", "0?connect?boolean", "false"});
  EXPECT_EQ(off.status, 0);
  EXPECT_EQ(off.errors, "");
  const InstanceRun::Result offAgain = instance.Loka({"write", "-q", "0?connect?boolean", "0"});
  EXPECT_EQ(offAgain.status, 1);
  EXPECT_EQ(offAgain.errors,
            "loka: error -1: Serial port not active for sending   hint: the port is disconnected "
            "already: the driver takes the value as a token to send; loka connect off reads the "
            "state first\n");
  EXPECT_TRUE(Holds(instance.Errors(), "port closed")) << instance.Errors();
}

TEST(ConnectCommand, ReadsTheStateFirst) {
  InstanceRun instance("tx_prefix=02 tx_suffix=03");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  EXPECT_EQ(instance.Output({"connect", "status"}), "connected\n");
  EXPECT_EQ(instance.Output({"connect", "on"}), "connected already; nothing done\n");
  EXPECT_EQ(instance.Output({"connect", "off"}), "disconnected\n");
  EXPECT_EQ(instance.Output({"connect", "off"}), "disconnected already; nothing done\n");
  EXPECT_EQ(instance.Output({"connect", "on", "-j"}), "{\"changed\":true,\"connected\":true}\n");
  EXPECT_EQ(instance.Loka({"connect", "maybe"}).status, 2);
  // Nothing was sent: what comes first is what is sent now.
  EXPECT_EQ(instance.Output({"write", "0?tx_token?string-9", "E"}), "");
  std::string sent;
  EXPECT_TRUE(instance.Line().Receive(3, Deadline::After(kLimitMs), &sent));
  EXPECT_EQ(sent,
            "\x02"
            "E\x03");
}

TEST(ConnectCommand, ExplainsAPortThatCannotBeOpened) {
  InstanceRun instance("");
  instance.Stop();
  const InstanceRun::Result on =
      instance.Loka({"connect", "on", "--port", "/dev/does-not-exist", "--config",
                     TestConfiguration("autoConnect=false")});
  EXPECT_EQ(on.status, 5);
  EXPECT_TRUE(Holds(on.errors, "error -1: Can't open serial port")) << on.errors;
  EXPECT_TRUE(Holds(on.errors, "/dev/does-not-exist: no such port")) << on.errors;
}

// A command that names another device must not reach this one.
TEST(InstanceChoice, OtherPortIsNotTheRunningInstance) {
  InstanceRun instance("gap=11");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  const PseudoTerminal other;
  const std::string gapUri = "0?SP_Gap?unsignedInt";
  const std::string configuration = TestConfiguration("gap=22");
  EXPECT_EQ(instance.Output(
                {"read", gapUri, "--port", other.Path(), "--config", configuration, "--no-store"}),
            "22\n");
  EXPECT_EQ(instance.Loka({"read", gapUri, "--port", other.Path(), "--attach"}).status, 5);
  const InstanceRun::Result same =
      instance.Loka({"read", gapUri, "--port", instance.Line().Path(), "--config", configuration});
  EXPECT_EQ(same.output, "11\n");
  EXPECT_TRUE(Holds(same.errors, "its own configuration holds")) << same.errors;
}

TEST(InstanceChoice, HelpHasAnExampleThatTheProgramTakes) {
  InstanceRun instance("rx_suffix=03");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  for (const char* const command : {"tags", "read", "write", "set", "connect"}) {
    const std::string help = instance.Output({command, "--help"});
    const std::size_t begin = help.find("Example: loka ");
    ASSERT_NE(begin, std::string::npos) << help;
    std::istringstream words(help.substr(begin + 14, help.find('\n', begin) - begin - 14));
    std::vector<std::string> arguments;
    for (std::string word; words >> word;) {
      const bool isQuoted = word.size() > 2 && word.front() == '\'';
      arguments.push_back(isQuoted ? word.substr(1, word.size() - 2) : word);
    }
    const InstanceRun::Result result = instance.Loka(arguments);
    EXPECT_EQ(result.status, 0) << help << result.errors;
  }
}

}  // namespace
