// SPDX-License-Identifier: Apache-2.0
// The console and the information text of the base class, with drivers that no host ever sees:
// without a name, without a document, with tags that can be counted.
#include <gtest/gtest.h>

#include <cstring>
#include <string>

#include "protlib/HostInterfaces.h"
#include "tests/support/GuardedBuffer.h"
#include "tests/support/ScriptedService.h"
#include "tests/unit/FailingNew.h"
#include "tests/unit/FakeDriver.h"
#include "tests/unit/HostInUse.h"

namespace {

constexpr const char* kHelp =
    "help - displays this message\n"
    "info - displays information about the protocol version\n"
    "xml  - displays the protocol xml description\n"
    "read uri - reads data pointed by uri string\n"
    "write uri hexData - writes data pointed by uri string\n"
    "lasterror - displays the last protocol error\n"
    "getmaxtm - displays the max time for executing a single read/write access\n";

constexpr const char* kInfo =
    "Protocol: FAKE (2) v.1\nImplementation: FakeDriver v.5\nProtocolBase v.100\nProtLib v.200\n";

// What the driver says about itself, for the test to set.
class TalkingDriver final : public FakeDriver {
 public:
  const char* GetName() const override { return name; }
  const char* GetImpName() const override { return implementation; }
  const char* GetXml() const override { return document; }
  bool IsConverted() const override { return isConverted; }
  int GetMaxTm(const ITag* tag) const override { return tag == nullptr ? maxTimeMs : -1; }

  const char* name = "FAKE";
  const char* implementation = "FakeDriver";
  const char* document = nullptr;
  bool isConverted = false;
  int maxTimeMs = 0;
};

class ProtocolBaseConsoleTest : public ::testing::Test {
 protected:
  // The whole reply buffer behind a command that the driver knows.
  std::string Bytes(const std::string& command, int sizeBytes) {
    GuardedBuffer reply(static_cast<std::size_t>(sizeBytes));
    EXPECT_TRUE(driver_.DoCommand(command.c_str(), reply.Chars(), sizeBytes)) << command;
    EXPECT_TRUE(reply.AreGuardsIntact()) << command;
    return reply.Bytes();
  }
  // The reply up to its terminator.
  std::string Reply(const std::string& command, int sizeBytes = 2000) {
    const std::string bytes = Bytes(command, sizeBytes);
    EXPECT_NE(bytes.find('\0'), std::string::npos) << command;
    return bytes.substr(0, bytes.find('\0'));
  }
  std::string Info(int sizeBytes = 2000) {
    GuardedBuffer buffer(static_cast<std::size_t>(sizeBytes));
    const int length = driver_.GetInfo(buffer.Chars(), sizeBytes);
    EXPECT_TRUE(buffer.AreGuardsIntact());
    return buffer.Bytes().substr(0, static_cast<std::size_t>(length));
  }
  std::string Error() {
    return std::to_string(driver_.GetLastError()) + " " + driver_.GetLastErrorString();
  }

  TalkingDriver driver_;
};

}  // namespace

// --- recognised or not ---

TEST_F(ProtocolBaseConsoleTest, UnknownCommandsLeaveTheReply) {
  for (const char* command :
       {"", " ", "HELP", "Xml", "helpx", "help\n", " help", "get", "deletetag"}) {
    GuardedBuffer reply(32);
    EXPECT_FALSE(driver_.DoCommand(command, reply.Chars(), 32)) << command;
    EXPECT_TRUE(reply.IsUntouched()) << command;
  }
  EXPECT_EQ(Error(), "1 ");
}

// --- help, xml, lasterror, getmaxtm ---

TEST_F(ProtocolBaseConsoleTest, HelpIsTheWholeText) {
  EXPECT_EQ(Reply("help"), kHelp);
  EXPECT_EQ(Reply("help me please"), kHelp);
}

TEST_F(ProtocolBaseConsoleTest, HelpIsCutWithoutATerminator) {
  const std::string help = kHelp;
  for (std::size_t size = 1; size <= help.size(); ++size) {
    EXPECT_EQ(Bytes("help", static_cast<int>(size)), help.substr(0, size));
  }
  EXPECT_EQ(Bytes("help", static_cast<int>(help.size()) + 1), help + '\0');
}

TEST_F(ProtocolBaseConsoleTest, XmlIsTheDriversDocument) {
  driver_.document = "<all about it/>";
  EXPECT_EQ(Reply("xml"), "<all about it/>");
}

TEST_F(ProtocolBaseConsoleTest, XmlWithoutADocumentIsEmpty) {
  EXPECT_EQ(Bytes("xml", 8), std::string(8, '\0'));
}

TEST_F(ProtocolBaseConsoleTest, LastErrorShowsTheTextAlone) {
  EXPECT_EQ(Reply("lasterror"), "");
  driver_.RecordError(-77, "device on fire");
  EXPECT_EQ(Reply("lasterror"), "device on fire");
  EXPECT_EQ(Error(), "-77 device on fire");
}

TEST_F(ProtocolBaseConsoleTest, GetMaxTmIsAskedWithoutATag) {
  EXPECT_EQ(Reply("getmaxtm"), "maxtm = 0 ms\n");
  driver_.maxTimeMs = 2147483647;
  EXPECT_EQ(Reply("getmaxtm now"), "maxtm = 2147483647 ms\n");
  driver_.maxTimeMs = -5;
  EXPECT_EQ(Reply("getmaxtm"), "maxtm = -5 ms\n");
}

// --- information text ---

TEST_F(ProtocolBaseConsoleTest, InfoWithoutServicesNamesTheDriverOnly) {
  EXPECT_EQ(Info(), kInfo);
  EXPECT_EQ(Reply("info"), kInfo);
  EXPECT_EQ(Reply("info at length"), kInfo);
}

TEST_F(ProtocolBaseConsoleTest, InfoNamesTheServicesThatThereAre) {
  HostInUse host;
  ScriptedService<ISocketFactory> sockets("ISocketFactory");
  const auto line = [](const INamedInterface& service) {
    return std::string(service.GetImpName()) + " v." + std::to_string(service.GetImpVersion()) +
           "\n";
  };
  const std::string tasks = line(host->MultiTask());
  const std::string ports = line(host->SerialFactory());
  EXPECT_EQ(Info(), kInfo + tasks + ports);
  piSocketFactory = &sockets;
  EXPECT_EQ(Info(), kInfo + tasks + ports + line(sockets));
  piMultiTask = nullptr;
  EXPECT_EQ(Info(), kInfo + ports + line(sockets));
  piSerialFactory = nullptr;
  EXPECT_EQ(Info(), kInfo + line(sockets));
  piSocketFactory = nullptr;
}

TEST_F(ProtocolBaseConsoleTest, InfoOfAConvertedDriverNamesNoService) {
  const HostInUse host;
  EXPECT_NE(Info(), kInfo);
  driver_.isConverted = true;
  EXPECT_EQ(Info(), kInfo);
}

TEST_F(ProtocolBaseConsoleTest, InfoStopsAtAMissingName) {
  driver_.implementation = nullptr;
  EXPECT_EQ(Info(), "Protocol: FAKE (2) v.1\nImplementation: ");
  driver_.name = nullptr;
  EXPECT_EQ(Info(), "Protocol: ");
  EXPECT_EQ(Bytes("info", 12), std::string("Protocol: \0\0", 12));
}

TEST_F(ProtocolBaseConsoleTest, InfoCountsWhatItWroteAndEndsWithNoZero) {
  const std::string info = kInfo;
  for (std::size_t size = 0; size <= info.size() + 1; ++size) {
    EXPECT_EQ(Info(static_cast<int>(size)), info.substr(0, size));
  }
  GuardedBuffer buffer(info.size() + 1);
  EXPECT_EQ(driver_.GetInfo(buffer.Chars(), static_cast<int>(info.size()) + 1),
            static_cast<int>(info.size()));
  EXPECT_NE(buffer.Bytes().back(), '\0');
  // The command adds the zero when there is room for it.
  EXPECT_EQ(Bytes("info", static_cast<int>(info.size())), info);
  EXPECT_EQ(Bytes("info", static_cast<int>(info.size()) + 1), info + '\0');
}

// --- read ---

TEST_F(ProtocolBaseConsoleTest, ReadShowsTheConvertedValueAndFreesItsTag) {
  driver_.image = {0xAB, 0x01, 0xFF, 0x10};
  EXPECT_EQ(Reply("read unsignedInt"), "ab01ff10\n");
  EXPECT_EQ(Reply("read unsignedInt(swap4)"), "10ff01ab\n");
  EXPECT_EQ(FakeTag::Living(), 0);
}

// A value has one byte for each bit, so eight bits of one device byte make eight bytes.
TEST_F(ProtocolBaseConsoleTest, ReadShowsTheHostValueOfBits) {
  driver_.image = {0x05};
  EXPECT_EQ(Reply("read boolean-8"), "0100010000000000\n");
}

TEST_F(ProtocolBaseConsoleTest, ReadOfNothingIsALineEnd) {
  EXPECT_EQ(Reply("read string-0"), "\n");
}

TEST_F(ProtocolBaseConsoleTest, ReadOfAnyLength) {
  for (const int lengthBytes : {63, 64, 65, 300}) {
    driver_.image.assign(300, 0x5A);
    std::string expected;
    for (int i = 0; i < lengthBytes; ++i) expected += "5a";
    EXPECT_EQ(Reply("read binary-" + std::to_string(lengthBytes)), expected + "\n");
  }
}

TEST_F(ProtocolBaseConsoleTest, ReadWithoutMemoryForItsValueSaysSo) {
  // The 65 bytes of the value do not fit on the stack; a refused allocation is an error like any.
  for (int nth = 1;; ++nth) {
    GuardedBuffer reply(200);
    bool hasFailed = false;
    {
      const FailingNew noMemory(nth);
      driver_.DoCommand("read binary-65", reply.Chars(), 200);
      hasFailed = noMemory.HasFailed();
    }
    EXPECT_TRUE(reply.AreGuardsIntact()) << nth;
    EXPECT_EQ(FakeTag::Living(), 0) << nth;
    if (!hasFailed) {
      EXPECT_GT(nth, 2);
      break;
    }
    EXPECT_EQ(Error(), "-1 Out of memory") << nth;
  }
}

TEST_F(ProtocolBaseConsoleTest, FailedReadsShowTheReasonAndFreeTheirTag) {
  EXPECT_EQ(Reply("read nonsense"), "Tag URI error: nonsense - no such type");
  EXPECT_EQ(Reply("read int(inv)"), "read conversion error");
  EXPECT_EQ(Error(), "-9 read conversion error");
  driver_.readsSucceed = false;
  EXPECT_EQ(Reply("read int"), "device silent");
  EXPECT_EQ(Error(), "-42 device silent");
  EXPECT_EQ(FakeTag::Living(), 0);
}

TEST_F(ProtocolBaseConsoleTest, ReadWantsTwoWords) {
  for (const char* command : {"read", "read int int", "read int ", "read  int"}) {
    EXPECT_EQ(Reply(command), "error: missing parameter (URI string)\n") << command;
  }
  EXPECT_EQ(driver_.blockReads, 0);
  EXPECT_EQ(Error(), "1 ");
}

// --- write ---

TEST_F(ProtocolBaseConsoleTest, WriteDecodesDigitsOfEitherCase) {
  EXPECT_EQ(Reply("write unsignedShort 0a0B"), "written ok\n");
  EXPECT_EQ(driver_.written, (::Bytes{0x0A, 0x0B}));
  EXPECT_EQ(Reply("write binary-8 0123456789abcdEF"), "written ok\n");
  EXPECT_EQ(driver_.written, (::Bytes{0x01, 0x23, 0x45, 0x67, 0x89, 0xAB, 0xCD, 0xEF}));
  EXPECT_EQ(FakeTag::Living(), 0);
}

TEST_F(ProtocolBaseConsoleTest, WriteOfAnyLength) {
  for (const std::size_t lengthBytes : {63U, 64U, 65U, 300U}) {
    std::string digits;
    for (std::size_t i = 0; i < lengthBytes; ++i) digits += "c3";
    EXPECT_EQ(Reply("write binary-" + std::to_string(lengthBytes) + " " + digits), "written ok\n");
    EXPECT_EQ(driver_.written, ::Bytes(lengthBytes, 0xC3));
  }
}

TEST_F(ProtocolBaseConsoleTest, WriteWantsTwoDigitsForEachByteOfTheValue) {
  for (const char* digits : {"0", "0A", "0A0", "0A0B0", "0A0B0C", "zz"}) {
    EXPECT_EQ(Reply(std::string("write short ") + digits),
              "error: incorrect length of data to write\n")
        << digits;
  }
  // Three bits are three bytes of the value, though one of the device.
  EXPECT_EQ(Reply("write boolean-3 05"), "error: incorrect length of data to write\n");
  EXPECT_EQ(Reply("write boolean-3 010001"), "written ok\n");
  EXPECT_EQ(FakeTag::Living(), 0);
}

TEST_F(ProtocolBaseConsoleTest, WriteRefusesEveryOtherCharacter) {
  const std::string digits = "0123456789abcdefABCDEF";
  for (int c = 1; c < 256; ++c) {
    const char character = static_cast<char>(static_cast<unsigned char>(c));
    if (character == ' ' || character == '\t') continue;  // these cut and trim words
    for (const bool isLow : {false, true}) {
      driver_.written.clear();
      const std::string pair = isLow ? std::string("0") + character : character + std::string("0");
      const bool isDigit = digits.find(character) != std::string::npos;
      EXPECT_EQ(Reply("write short 00" + pair),
                isDigit ? "written ok\n" : "error: incorrect hex data\n")
          << c;
      EXPECT_EQ(driver_.written.empty(), !isDigit) << c;
    }
  }
  EXPECT_EQ(FakeTag::Living(), 0);
  EXPECT_EQ(Error(), "1 ");
}

TEST_F(ProtocolBaseConsoleTest, FailedWritesShowTheReasonAndFreeTheirTag) {
  EXPECT_EQ(Reply("write nonsense 00"), "Tag URI error: nonsense - no such type");
  driver_.RecordError(-42, "device busy");
  driver_.writeResult = 0;
  EXPECT_EQ(Reply("write byte 00"), "device busy");
  EXPECT_EQ(FakeTag::Living(), 0);
}

TEST_F(ProtocolBaseConsoleTest, WriteWantsThreeWords) {
  for (const char* command :
       {"write", "write byte", "write byte 00 00", "write  byte 00", "write byte 00 "}) {
    EXPECT_EQ(Reply(command), "error: missing parameters (URI string + data)\n") << command;
  }
  EXPECT_TRUE(driver_.written.empty());
  EXPECT_EQ(Error(), "1 ");
}

// --- deletetags ---

TEST_F(ProtocolBaseConsoleTest, DeleteTagsDestroysTheTagsOfTheHost) {
  for (int i = 0; i < 5; ++i) ASSERT_NE(driver_.CreateTag("int"), nullptr);
  EXPECT_EQ(FakeTag::Living(), 5);
  GuardedBuffer reply(32);
  EXPECT_TRUE(driver_.DoCommand("deletetags", reply.Chars(), 32));
  EXPECT_TRUE(reply.IsUntouched());
  EXPECT_EQ(FakeTag::Living(), 0);
}

// The tag of a command comes and goes; those of the host stay.
TEST_F(ProtocolBaseConsoleTest, ReadAndWriteLeaveTheTagsOfTheHost) {
  const ITag* tag = driver_.CreateTag("short");
  ASSERT_NE(tag, nullptr);
  Reply("read int");
  Reply("write byte 00");
  EXPECT_EQ(FakeTag::Living(), 1);
  EXPECT_STREQ(tag->GetVarName(), "short");
}
