// SPDX-License-Identifier: Apache-2.0
// The plug-in's objects called by slot number alone. No interface header takes part in the calls of
// this file; the numbers and signatures stand here a second time on purpose.
#include <gtest/gtest.h>

#include <cstring>
#include <new>
#include <string>

#include "tests/abi/RawTable.h"
#include "tests/support/PluginLibrary.h"
#include "tests/support/ScriptedHost.h"

namespace {

using Bytes = unsigned char*;
using ConstBytes = const unsigned char*;
using Text = const char*;

class DriverSlotsTest : public ::testing::Test {
 protected:
  void SetUp() override {
    PluginLibrary& library = PluginLibrary::Shared();
    ASSERT_NE(library.Factory(), nullptr) << library.Error();
    factory_ = library.Factory();
    module_ = CallSlot<void*, Text>(factory_, 0, "IProtModule");
    protocols_ = CallSlot<void*, Text>(factory_, 0, "IProtocolFactory");
    ASSERT_NE(module_, nullptr);
    ASSERT_NE(protocols_, nullptr);
    void* host = static_cast<IInterfaceFactory*>(&host_);
    ASSERT_EQ((CallSlot<int, void*>(module_, 5, host)), 1);
    protocol_ = CallSlot<void*, Text>(protocols_, 5, "LOKA");
    ASSERT_NE(protocol_, nullptr);
    ASSERT_NE((Call<int, Text>(5,
                               "CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 "
                               "stopbits=1 mode=RS-232 rx_suffix=03 tx_prefix=02")),
              0);
    host_.Log().Take();
  }
  void TearDown() override {
    if (protocol_ != nullptr) {
      Call<int>(10);
      CallSlot<void, void*>(protocols_, 6, protocol_);
    }
    if (module_ != nullptr) CallSlot<void>(module_, 6);
    EXPECT_EQ(host_.Complaints(), "");
  }

  template <class Result, class... Arguments>
  Result Call(int slot, Arguments... arguments) {
    return CallSlot<Result, Arguments...>(protocol_, slot, arguments...);
  }
  void* Tag(Text uri) { return Call<void*, Text>(6, uri); }
  std::string Error() { return std::to_string(Call<int>(21)) + " " + Call<Text>(22); }
  std::string Calls() { return host_.Log().Take(); }

  ScriptedHost host_;
  void* factory_ = nullptr;
  void* module_ = nullptr;
  void* protocols_ = nullptr;
  void* protocol_ = nullptr;
};

TEST_F(DriverSlotsTest, InterfaceFactory) {
  EXPECT_EQ((CallSlot<void*, Text>(factory_, 0, "ProtModule")), module_);
  EXPECT_EQ((CallSlot<void*, Text>(factory_, 0, "nosuch")), nullptr);
  CallSlot<void, void*>(factory_, 1, module_);
  EXPECT_EQ((CallSlot<void*, Text>(factory_, 0, "ProtModule")), module_);
}

TEST_F(DriverSlotsTest, Module) {
  EXPECT_EQ((CallSlot<void*, Text>(module_, 2, "ProtModule")), module_);
  EXPECT_STREQ(CallSlot<Text>(module_, 3), "ProtModule");
  EXPECT_EQ(CallSlot<int>(module_, 4), 100);
  // Init and Close (slots 5 and 6) count; nothing is released while one use is left.
  EXPECT_EQ((CallSlot<int, void*>(module_, 5, nullptr)), 1);
  CallSlot<void>(module_, 6);
  EXPECT_EQ(Calls(), "");
  EXPECT_NE(CallSlot<Text>(module_, 7), nullptr);
}

TEST_F(DriverSlotsTest, ModuleErrorText) {
  Call<int>(10);
  CallSlot<void, void*>(protocols_, 6, protocol_);
  protocol_ = nullptr;
  CallSlot<void>(module_, 6);
  ScriptedHost poor;
  poor.SetAbsent("ISocketFactory");
  void* host = static_cast<IInterfaceFactory*>(&poor);
  EXPECT_EQ((CallSlot<int, void*>(module_, 5, host)), 0);
  EXPECT_STREQ(CallSlot<Text>(module_, 7), "ISocketFactory not created");
  module_ = nullptr;
}

TEST_F(DriverSlotsTest, ProtocolFactory) {
  EXPECT_EQ((CallSlot<void*, Text>(protocols_, 2, "ProtocolFactory")), protocols_);
  EXPECT_STREQ(CallSlot<Text>(protocols_, 3), "ProtFactoryInDLL");
  EXPECT_EQ(CallSlot<int>(protocols_, 4), 100);
  EXPECT_EQ((CallSlot<void*, Text>(protocols_, 5, "loka")), nullptr);
  CallSlot<void, void*>(protocols_, 6, nullptr);
}

TEST_F(DriverSlotsTest, ProtocolSlot0DestroysAndSlot1AlsoFrees) {
  void* first = CallSlot<void*, Text>(protocols_, 5, "LOKA");
  Calls();
  CallSlot<void>(first, 0);
  EXPECT_EQ(Calls(), "DeleteSemaphore queue2\nDeleteSemaphore port2\n");
  ::operator delete(first);
  void* second = CallSlot<void*, Text>(protocols_, 5, "LOKA");
  Calls();
  CallSlot<void>(second, 1);
  EXPECT_EQ(Calls(), "DeleteSemaphore queue3\nDeleteSemaphore port3\n");
}

TEST_F(DriverSlotsTest, ProtocolSlots2To4And19To32) {
  EXPECT_EQ((Call<void*, Text>(2, "IProtocol7")), protocol_);
  EXPECT_STREQ(Call<Text>(3), "Protocol_LOKA");
  EXPECT_EQ(Call<int>(4), 100);
  EXPECT_STREQ(Call<Text>(19), "LOKA");
  EXPECT_STREQ(Call<Text>(20), "LOKA");
  EXPECT_EQ(Call<int>(21), 1);
  EXPECT_STREQ(Call<Text>(22), "");
  EXPECT_EQ(Call<int>(23), 111);
  EXPECT_EQ(Call<int>(24), 471);
  EXPECT_STREQ(Call<Text>(25), "Loka Serial");
  char buffer[1000] = {};
  const int written = Call<int, char*, int>(26, buffer, 1000);
  EXPECT_GE(written, 0);
  EXPECT_LE(written, 1000);
  Call<Text>(27);
  EXPECT_FALSE(Call<bool>(28));
  EXPECT_STREQ(Call<Text>(29), "LOKA");
  Call<void, Text>(30, "other");
  EXPECT_STREQ(Call<Text>(29), "other");
  EXPECT_FALSE((Call<bool, Text, char*, int>(31, "no such command", buffer, 1000)));
  struct {
    int number;
    unsigned char flags[4];
  } record = {3, {9, 9, 9, 9}};
  EXPECT_EQ((Call<int, int, void*>(32, 0, &record)), 1);
  EXPECT_EQ(record.flags[0], 1);
}

TEST_F(DriverSlotsTest, ProtocolSlots5To14) {
  EXPECT_EQ((Call<int, Text>(5, "CfgVer=2")), 0);
  EXPECT_EQ(Error(), "-1 Parser: unknown format");
  void* tag = Tag("0?rx_token?string-4");
  ASSERT_NE(tag, nullptr);
  EXPECT_TRUE((Call<bool, const void*, const void*, bool>(8, tag, tag, false)));
  EXPECT_FALSE((Call<bool, const void*, const void*, bool>(8, tag, tag, true)));
  unsigned char value[8] = {9, 9, 9, 9, 9, 9, 9, 9};
  EXPECT_EQ((Call<int, const void*, Bytes>(11, tag, value)), 0);
  EXPECT_EQ(Error(), "-3 Protocol not started");
  EXPECT_NE(Call<int>(9), 0);
  EXPECT_EQ(host_.Log().Count("OpenPort com1"), 1);
  Calls();
  EXPECT_NE((Call<int, const void*, Bytes>(11, tag, value)), 0);
  EXPECT_EQ(value[0], 0);
  EXPECT_EQ((Call<int, const void*, ConstBytes>(12, tag, value)), 0);
  EXPECT_EQ(Error(), "-1 writing to read_only type");
  value[0] = 9;
  EXPECT_EQ((Call<int, const void*, Bytes, int>(13, tag, value, 1)), 1);
  EXPECT_EQ(value[0], 0);
  EXPECT_EQ((Call<int, const void*, ConstBytes, int>(14, tag, value, 4)), 0);
  EXPECT_EQ(Error(), "-3 Optimized writing not supported");
  Call<void, void*>(7, tag);
  EXPECT_NE(Call<int>(10), 0);
  EXPECT_EQ(host_.Log().Count("StopTask 1000 -> 1"), 1);
}

TEST_F(DriverSlotsTest, ProtocolSlots15To18And33To51) {
  void* tag = Tag("3?rx_token?string-4");
  const void* tags[2] = {tag, tag};
  const void* const* list = tags;
  unsigned char buffer[8] = {};
  int status[2] = {7, 7};
  EXPECT_EQ((Call<int, const void*>(15, tag)), 0);
  EXPECT_EQ((Call<int, const void*>(16, tag)), 0);
  EXPECT_FALSE((Call<bool, const void*, const void*>(17, tag, tag)));
  EXPECT_EQ((Call<int, const void* const*, int, Bytes>(18, list, 2, buffer)), 0);
  EXPECT_FALSE((Call<bool, const void* const*, int, const void*>(33, list, 1, tag)));
  EXPECT_EQ((Call<int, const void* const*, int, Bytes, int*>(34, list, 2, buffer, status)), 0);
  EXPECT_EQ(status[0], 7);
  EXPECT_FALSE(Call<bool>(35));
  EXPECT_EQ((Call<int, void*>(36, nullptr)), 0);
  EXPECT_FALSE(Call<bool>(37));
  EXPECT_EQ((Call<int, void*>(38, nullptr)), 0);
  EXPECT_EQ((Call<int, const void*>(39, tag)), 3);
  EXPECT_FALSE((Call<bool, const void*>(40, tag)));
  EXPECT_EQ((Call<int, const void*, Bytes, int>(41, tag, buffer, 8)), 0);
  EXPECT_EQ((Call<void*, Text>(42, "IProtocol")), nullptr);
  EXPECT_EQ((Call<int, const void*>(43, tag)), 16777215);
  void* empty = Tag("0?rx_token?string-0");
  EXPECT_FALSE((Call<bool, const void*, const void*>(44, tag, empty)));
  EXPECT_TRUE((Call<bool, const void*, const void*>(45, tag, empty)));
  EXPECT_FALSE((Call<bool, const void*>(46, tag)));
  EXPECT_FALSE((Call<bool, const void*>(47, tag)));
  EXPECT_FALSE((Call<bool, const void* const*, int, const void*>(48, list, 1, tag)));
  EXPECT_EQ((Call<int, const void* const*, int, ConstBytes, int*>(49, list, 2, buffer, status)), 0);
  EXPECT_FALSE((Call<bool, const void*>(50, tag)));
  EXPECT_EQ((Call<int, const void*, ConstBytes, int>(51, tag, buffer, 8)), 0);
  EXPECT_EQ(Error(), "1 ");
}

TEST_F(DriverSlotsTest, ProtocolSlots52To70) {
  void* tag = Tag("0?rx_token?string-4");
  const auto fails = [this](const char* expected) {
    const std::string error = Error();
    Call<int, const void*, ConstBytes, int>(14, nullptr, nullptr, 0);  // another text in between
    return error == std::string("-1 ") + expected;
  };
  EXPECT_FALSE((Call<bool, const void*, void*>(52, tag, nullptr)));
  EXPECT_TRUE(fails("read object not supported"));
  EXPECT_FALSE((Call<bool, const void*, const void*>(53, tag, nullptr)));
  EXPECT_TRUE(fails("write object not supported"));
  EXPECT_EQ(Call<int>(54), 2);
  char text[64] = {};
  EXPECT_EQ((Call<int, char*, int>(55, text, 64)), 1);
  EXPECT_STREQ(text, "com1,9600,even,8,1,RS-232");
  EXPECT_EQ((Call<int, unsigned short>(56, 5)), 0);
  EXPECT_EQ((Call<void*, int>(57, 1)), nullptr);
  EXPECT_TRUE(fails("protocol does not support event channel"));
  EXPECT_EQ((Call<void*, void*>(58, nullptr)), nullptr);
  EXPECT_TRUE(fails("protocol does not support event channel"));
  Call<void, void*>(59, nullptr);
  EXPECT_EQ((Call<int, void*, Text>(60, nullptr, "x")), 0);
  EXPECT_TRUE(fails("protocol does not support event channel"));
  EXPECT_EQ((Call<int, void*, void*>(61, nullptr, nullptr)), 0);
  EXPECT_TRUE(fails("protocol does not support event channel"));
  const std::string quiet = Error();
  EXPECT_EQ((Call<void*, void*>(62, nullptr)), nullptr);
  Call<void, void*>(63, nullptr);
  EXPECT_EQ(Error(), quiet);
  EXPECT_EQ((Call<void*, Text>(64, "x")), nullptr);
  EXPECT_TRUE(fails("protocol does not support alarms"));
  Call<void, void*>(65, nullptr);
  EXPECT_EQ((Call<int, void*>(66, nullptr)), 0);
  EXPECT_EQ((Call<int, void*>(67, nullptr)), 0);
  EXPECT_EQ(Error(), quiet);
  EXPECT_EQ((Call<void*, Text>(68, "x")), nullptr);
  EXPECT_TRUE(fails("protocol does not support trends"));
  Call<void, void*>(69, nullptr);
  unsigned long long last = 7;
  EXPECT_EQ((Call<int, void*, unsigned long long, unsigned long long, unsigned long long*, unsigned,
                  bool, void*>(70, nullptr, 1, 2, &last, 3, true, nullptr)),
            0);
  EXPECT_EQ(last, 7U);
  EXPECT_EQ(Error(), quiet);
}

TEST_F(DriverSlotsTest, ProtocolSlots71To84) {
  void* tag = Tag("3?rx_token?string-4");
  void* scalar = Tag("0?SP_Baud?unsignedInt");
  ASSERT_NE(Call<int>(9), 0);
  host_.Line().Feed("AB\x03");
  host_.RunUntilSilent();
  unsigned char buffer[8] = {};
  unsigned long long stamps[2] = {0, 0};
  int status[2] = {7, 7};
  const void* tags[2] = {tag, tag};
  const void* const* list = tags;
  EXPECT_FALSE((Call<bool, const void*>(71, tag)));
  EXPECT_NE((Call<int, const void*, Bytes, unsigned long long*>(72, tag, buffer, stamps)), 0);
  EXPECT_EQ(std::memcmp(buffer, "AB\0\0", 4), 0);
  EXPECT_GT(stamps[0], 1600000000000ULL);
  stamps[0] = 0;
  EXPECT_EQ((Call<int, const void*, Bytes, int, unsigned long long*>(73, tag, buffer, 2, stamps)),
            1);
  EXPECT_GT(stamps[0], 1600000000000ULL);
  stamps[0] = 5;
  EXPECT_EQ((Call<int, const void* const*, int, Bytes, int*, unsigned long long*>(
                74, list, 2, buffer, status, stamps)),
            0);
  EXPECT_EQ(stamps[0], 5U);
  EXPECT_EQ(Call<int>(75), 3);
  EXPECT_STREQ((Call<Text, int>(76, 1)), "memorytype");
  EXPECT_EQ((Call<int, Text>(77, "datatype")), 2);
  int length = 0;
  const Text field = Call<Text, const void*, int, int*>(78, tag, 2, &length);
  ASSERT_NE(field, nullptr);
  EXPECT_EQ(std::string(field, field + length), "string-4");
  EXPECT_NE((Call<int, const void*, int, Bytes>(79, tag, 1, buffer)), 0);
  EXPECT_EQ(buffer[0], 'B');
  EXPECT_EQ((Call<int, const void*, int, ConstBytes>(80, tag, 1, buffer)), 0);
  EXPECT_EQ(Error(), "-1 writing to read_only type");
  EXPECT_EQ((Call<int, const void*, int, ConstBytes>(80, scalar, 0, buffer)), 0);
  EXPECT_EQ(Error(), "-1 accessing an array item where the tag is not array");
  EXPECT_EQ((Call<int, const void*, Bytes, int, unsigned long long*>(81, tag, buffer, 8, stamps)),
            0);
  EXPECT_EQ(stamps[0], 5U);

  // 82 makes a tag that the protocol does not list, so it is freed by hand.
  void* unlisted = Call<void*, Text>(82, "5?connect?boolean");
  ASSERT_NE(unlisted, nullptr);
  EXPECT_EQ((Call<int, const void*>(39, unlisted)), 5);
  CallSlot<void>(unlisted, 1);
  EXPECT_EQ((Call<void*, Text>(82, "5?connect")), nullptr);
  EXPECT_EQ(Error(), "-1 Tag URI error: 5?connect - there must be 3 tag specification fields");
  EXPECT_EQ((Call<int, const void*>(83, tag)), 0);
  auto* const names = Call<const Text*>(84);
  ASSERT_NE(names, nullptr);
  EXPECT_STREQ(names[0], "node");
  EXPECT_STREQ(names[1], "memorytype");
  EXPECT_STREQ(names[2], "datatype");
  EXPECT_EQ(names[3], nullptr);
}

TEST_F(DriverSlotsTest, TagSlots) {
  void* tag = Tag("0?SP_Baud?unsignedInt(swap4)");
  ASSERT_NE(tag, nullptr);
  void* clone = CallSlot<void*>(tag, 2);
  ASSERT_NE(clone, nullptr);
  EXPECT_NE(clone, tag);
  EXPECT_EQ(CallSlot<unsigned>(tag, 3), 0U);
  EXPECT_EQ(CallSlot<int>(tag, 4), 0);
  EXPECT_STREQ(CallSlot<Text>(tag, 5), "0?SP_Baud?unsignedInt(swap4)");
  EXPECT_EQ(CallSlot<int>(tag, 6), 7);
  EXPECT_EQ(CallSlot<int>(tag, 7), 4);
  EXPECT_EQ(CallSlot<int>(tag, 8), 0);
  EXPECT_EQ(CallSlot<int>(tag, 9), 4);
  const unsigned char in[4] = {1, 2, 3, 4};
  unsigned char out[4] = {};
  EXPECT_TRUE((CallSlot<bool, ConstBytes, Bytes, bool>(tag, 10, in, out, true)));
  EXPECT_EQ(out[0], 4);
  EXPECT_FALSE(CallSlot<bool>(tag, 11));
  EXPECT_FALSE(CallSlot<bool>(tag, 12));
  EXPECT_TRUE((CallSlot<bool, ConstBytes, Bytes, bool>(tag, 13, in, out, false)));
  EXPECT_EQ(out[0], 4);
  EXPECT_TRUE((CallSlot<bool, Bytes, Text, bool>(tag, 14, out, "swap2", true)));
  EXPECT_EQ(out[0], 3);
  EXPECT_FALSE((CallSlot<bool, Bytes, Text, bool>(tag, 14, out, "nosuch", true)));
  CallSlot<void>(clone, 1);
  void* string = Tag("0?rx_token?string-9");
  EXPECT_EQ(CallSlot<int>(string, 6), 10);
  EXPECT_EQ(CallSlot<int>(string, 7), 9);
  EXPECT_EQ(CallSlot<int>(string, 8), 2);
  EXPECT_TRUE(CallSlot<bool>(string, 11));
  EXPECT_FALSE(CallSlot<bool>(string, 12));
  void* send = Tag("0?tx_token?string-9");
  EXPECT_FALSE(CallSlot<bool>(send, 11));
  EXPECT_TRUE(CallSlot<bool>(send, 12));
}

}  // namespace
