// SPDX-License-Identifier: Apache-2.0
// The console commands that every driver has, the information text, and how replies are copied.
#include <cstring>

#include "tests/plugin/ConsoleFixture.h"

namespace {

constexpr const char* kGenericHelp =
    "help - displays this message\n"
    "info - displays information about the protocol version\n"
    "xml  - displays the protocol xml description\n"
    "read uri - reads data pointed by uri string\n"
    "write uri hexData - writes data pointed by uri string\n"
    "lasterror - displays the last protocol error\n"
    "getmaxtm - displays the max time for executing a single read/write access\n";

constexpr const char* kOwnInfo =
    "Protocol: LOKA (471) v.111\n"
    "Implementation: Protocol_LOKA v.100\n"
    "ProtocolBase v.100\n"
    "ProtLib v.200\n";

using GenericConsoleTest = ConsoleFixture;

TEST_F(GenericConsoleTest, UnknownCommandsAreNotRecognised) {
  for (const char* command : {"", " ", "HELP", "Help", "xyz", "helpme", "\n", "read?", "infox"}) {
    const ConsoleReply reply = Command(command);
    EXPECT_FALSE(reply.result) << command;
    EXPECT_TRUE(reply.untouched) << command;
  }
}

TEST_F(GenericConsoleTest, HelpStartsWithTheGenericText) {
  const ConsoleReply reply = Command("help");
  EXPECT_TRUE(reply.result);
  EXPECT_EQ(reply.text.substr(0, std::strlen(kGenericHelp)), kGenericHelp);
}

TEST_F(GenericConsoleTest, TrimsWordsAndIgnoresFurtherOnes) {
  EXPECT_EQ(Command("getmaxtm").text, "maxtm = 0 ms\n");
  EXPECT_EQ(Command("getmaxtm and more").text, "maxtm = 0 ms\n");
  EXPECT_EQ(Command("\tgetmaxtm\t").text, "maxtm = 0 ms\n");
  EXPECT_FALSE(Command(" getmaxtm").result) << "a leading blank makes an empty first word";
}

TEST_F(GenericConsoleTest, InfoNamesDriverAndServices) {
  const ConsoleReply reply = Command("info");
  EXPECT_TRUE(reply.result);
  EXPECT_EQ(reply.text, std::string(kOwnInfo) + ServiceLines());
  EXPECT_EQ(GetInfo(1000), std::string(kOwnInfo) + ServiceLines());
}

TEST_F(GenericConsoleTest, InfoIsCutToTheBufferWithoutATerminator) {
  const std::string whole = std::string(kOwnInfo) + ServiceLines();
  for (std::size_t size = 0; size <= whole.size() + 2; ++size) {
    EXPECT_EQ(GetInfo(static_cast<int>(size)), whole.substr(0, size));
    const ConsoleReply reply = Command("info", static_cast<int>(size));
    EXPECT_TRUE(reply.result);
    EXPECT_EQ(reply.text, whole.substr(0, size));
    EXPECT_EQ(reply.terminated, size > whole.size()) << size;
  }
}

TEST_F(GenericConsoleTest, InfoStopsAtAServiceWithoutAName) {
  const std::string services = ServiceLines();
  const std::string first = services.substr(0, services.find('\n') + 1);
  host_.SerialFactory().SetNameless(true);
  EXPECT_EQ(GetInfo(1000), kOwnInfo + first);
  host_.SerialFactory().SetNameless(false);
}

TEST_F(GenericConsoleTest, XmlGivesTheLengthLine) {
  EXPECT_EQ(Command("xml").text, "compressedXML=1782");
  EXPECT_EQ(Command("xml whatever").text, "compressedXML=1782");
}

TEST_F(GenericConsoleTest, LastErrorWithoutAndWithAnError) {
  EXPECT_EQ(Command("lasterror").text, "");
  EXPECT_FALSE(P().Tag("0?none?boolean"));
  EXPECT_EQ(Command("lasterror").text, "Tag URI error: 0?none?boolean - Can't access memory type");
}

// --- read ---

TEST_F(GenericConsoleTest, ReadWantsExactlyOneUri) {
  for (const char* command :
       {"read", "read ", "read a b", "read  0?connect?boolean", "read 0?connect?boolean "}) {
    const ConsoleReply reply = Command(command);
    EXPECT_TRUE(reply.result) << command;
    const bool isEmptyUri = std::string(command) == "read ";
    EXPECT_EQ(reply.text, isEmptyUri ? "Tag URI error:  - there must be 3 tag specification fields"
                                     : "error: missing parameter (URI string)\n")
        << command;
  }
}

TEST_F(GenericConsoleTest, ReadRepliesInLowerCaseHex) {
  Run();
  Receive("\x02HELLO\xAF\x03");
  EXPECT_EQ(Command("read 0?rx_token?string-8").text, "48454c4c4faf0000\n");
  EXPECT_EQ(Command("read 0?tokens_available?unsignedInt").text, "01000000\n");
  EXPECT_EQ(Command("read 0?connect?boolean").text, "01\n");
}

TEST_F(GenericConsoleTest, ReadAppliesConversions) {
  Run();
  Receive("\x02HELLO\x03");
  EXPECT_EQ(Command("read 0?rx_token_len?unsignedInt(swap4)").text, "00000005\n");
}

TEST_F(GenericConsoleTest, ReadKeepsRoomForTheLineEnd) {
  Run();
  const struct {
    int size;
    const char* text;
  } rows[] = {{11, "00000000\n"}, {10, "000000\n"}, {9, "000000\n"}, {8, "0000\n"}, {7, "0000\n"},
              {6, "00\n"},        {5, "00\n"},      {4, "\n"},       {3, "\n"},     {2, "\n"}};
  for (const auto& row : rows) {
    const ConsoleReply reply = Command("read 0?tokens_available?unsignedInt", row.size);
    EXPECT_TRUE(reply.result);
    EXPECT_EQ(reply.text, row.text) << row.size;
    EXPECT_TRUE(reply.terminated) << row.size;
  }
  EXPECT_EQ(Command("read 0?tokens_available?unsignedInt", 1).text, "\n");
  EXPECT_TRUE(Command("read 0?tokens_available?unsignedInt", 0).untouched);
}

TEST_F(GenericConsoleTest, ReadWritesInPlaceAndNoFurther) {
  Run();
  const ConsoleReply reply = Command("read 0?connect?boolean", 64);
  EXPECT_EQ(reply.bytes.substr(0, 4), std::string("01\n\0", 4));
  EXPECT_EQ(reply.bytes.substr(4), std::string(60, static_cast<char>(GuardedBuffer::kFill)));
}

TEST_F(GenericConsoleTest, ReadReportsTheDriversError) {
  ASSERT_TRUE(P().Config(Mandatory()));
  EXPECT_EQ(Command("read 0?connect?boolean").text, "Protocol not started");
  Run();
  Receive("\x02HELLO\x03");
  EXPECT_EQ(Command("read 0?rx_token?string-5").text, "token too long");
  EXPECT_EQ(P().Error(), "-1 token too long");
  EXPECT_EQ(Command("read 0?rx_token?strin-5").text,
            "Tag URI error: 0?rx_token?strin-5 - strin-5: data type unknown");
  EXPECT_EQ(Command("read 0?rx_token_len?unsignedInt(what)").text, "read conversion error");
}

TEST_F(GenericConsoleTest, ReadOfALongValueUsesNoFixedBuffer) {
  Run("hex_tokens=true");
  Receive("\x02" + std::string(900, 'x') + "\x03");
  const ConsoleReply reply = Command("read 0?rx_token?string-2000", 5000);
  EXPECT_EQ(reply.text.size(), 2U * 2000 + 1);
  EXPECT_EQ(reply.text.substr(0, 8), "37383738");  // the text "78..." of the byte 'x'
}

TEST_F(GenericConsoleTest, ReadTakesTheSemaphoreOfItsTagOnly) {
  Run();
  Command("read 0?tokens_available?unsignedInt");
  EXPECT_EQ(Calls(), "queue.Lock\nqueue.Unlock\n");
  Command("read 0?SP_Baud?unsignedInt");
  EXPECT_EQ(Calls(), "");
}

// --- write ---

TEST_F(GenericConsoleTest, WriteWantsUriAndData) {
  for (const char* command : {"write", "write 0?SP_Baud?unsignedInt", "write a b c",
                              "write  0?SP_Bits?unsignedByte 08"}) {
    const ConsoleReply reply = Command(command);
    EXPECT_TRUE(reply.result) << command;
    EXPECT_EQ(reply.text, "error: missing parameters (URI string + data)\n") << command;
  }
}

TEST_F(GenericConsoleTest, WriteChecksLengthThenDigits) {
  Run();
  EXPECT_EQ(Command("write 0?SP_RxPrefix?string-2 0A").text,
            "error: incorrect length of data to write\n");
  EXPECT_EQ(Command("write 0?SP_RxPrefix?string-2 0A0B0C").text,
            "error: incorrect length of data to write\n");
  EXPECT_EQ(Command("write 0?SP_RxPrefix?string-2 0G00").text, "error: incorrect hex data\n");
  EXPECT_EQ(Command("write 0?SP_RxPrefix?string-2 000G").text, "error: incorrect hex data\n");
  EXPECT_EQ(Command("write 0?SP_RxPrefix?string-2 0:00").text, "error: incorrect hex data\n");
  // An empty text in a two-byte tag is a prefix without bytes; the digits may be of either case.
  EXPECT_EQ(Command("write 0?SP_RxPrefix?string-3 0a0B00").text,
            "Rx prefix value is not hex format");
  EXPECT_EQ(Command("write 0?SP_RxPrefix?string-3 306100").text, "written ok\n");
  EXPECT_EQ(P().ReadText("SP_RxPrefix"), "0a");
  EXPECT_EQ(Command("write 0?SP_Baud?unsignedInt 00C20100").text, "written ok\n");
  EXPECT_EQ(P().ReadNumber("SP_Baud"), 115200U);
  EXPECT_EQ(Command("write 0?SP_Baud?unsignedInt 00c20100").text, "written ok\n");
}

TEST_F(GenericConsoleTest, WriteReportsTheDriversError) {
  ASSERT_TRUE(P().Config(Mandatory()));
  EXPECT_EQ(Command("write 0?SP_Bits?unsignedByte 08").text, "Protocol not started");
  Run();
  EXPECT_EQ(Command("write 0?rx_token_len?unsignedInt 00000000").text, "writing to read_only type");
  EXPECT_EQ(Command("write 0?SP_Baud?unsignedInt 01000000").text, "illegal baudrate intValue");
  EXPECT_EQ(Command("write 0?SP_Baud 01000000").text,
            "Tag URI error: 0?SP_Baud - there must be 3 tag specification fields");
}

TEST_F(GenericConsoleTest, WriteSendsAToken) {
  Run("tx_prefix=02 tx_suffix=03");
  EXPECT_EQ(Command("write 0?tx_token?string-4 41420000").text, "written ok\n");
  EXPECT_EQ(Calls(), "queue.Lock\nSend 02 41 42 03\nqueue.Unlock\n");
}

// --- tags ---

TEST_F(GenericConsoleTest, DeleteTagsLeavesTheReply) {
  ASSERT_TRUE(P().Config(Mandatory()));
  ASSERT_NE(P().Tag("0?connect?boolean"), nullptr);
  ASSERT_NE(P().Tag("0?token_ack?boolean"), nullptr);
  const ConsoleReply reply = Command("deletetags");
  EXPECT_TRUE(reply.result);
  EXPECT_TRUE(reply.untouched);
  EXPECT_TRUE(Command("deletetags now").result);
}

// --- bounded copies ---

TEST_F(GenericConsoleTest, ShortRepliesAreFilledWithZeros) {
  const ConsoleReply reply = Command("getmaxtm", 40);
  const std::string text = "maxtm = 0 ms\n";
  EXPECT_EQ(reply.bytes, text + std::string(40 - text.size(), '\0'));
}

TEST_F(GenericConsoleTest, LongRepliesAreCutWithoutATerminator) {
  const std::string text = "maxtm = 0 ms\n";
  for (int size = 0; size <= static_cast<int>(text.size()); ++size) {
    const ConsoleReply reply = Command("getmaxtm", size);
    EXPECT_TRUE(reply.result);
    EXPECT_EQ(reply.bytes, text.substr(0, static_cast<std::size_t>(size)));
  }
}

TEST_F(GenericConsoleTest, NoReplyBuffer) {
  EXPECT_FALSE(P()->DoCommand(nullptr, nullptr, 0));
  for (const char* command : {"help", "info", "xml", "lasterror", "getmaxtm", "read",
                              "read 0?SP_Baud?unsignedInt", "write a b", "get", "put x"}) {
    P()->DoCommand(command, nullptr, 100);
    P()->DoCommand(command, nullptr, -1);
    char reply = 'x';
    P()->DoCommand(command, &reply, -5);
    EXPECT_EQ(reply, 'x') << command;
  }
  EXPECT_EQ(P()->GetInfo(nullptr, 10), 0);
  char buffer = 'x';
  EXPECT_EQ(P()->GetInfo(&buffer, -1), 0);
  EXPECT_EQ(buffer, 'x');
}

}  // namespace
