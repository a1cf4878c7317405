// SPDX-License-Identifier: Apache-2.0
// The module: obtaining and releasing the host's services.
#include <gtest/gtest.h>

#include <ostream>

#include "tests/support/PluginUnderTest.h"
#include "tests/support/ScriptedHost.h"

namespace {

constexpr const char* kAllAsked =
    "CreateInterface IMultiTask2\nCreateInterface ISerialFactory\nCreateInterface ISocketFactory\n"
    "CreateInterface ICDSBuffer\nCreateInterface IDiag\nCreateInterface IPermanentStorage\n"
    "CreateInterface IDriverInterface\nCreateInterface ISmux\nCreateInterface IFastTimer\n";

constexpr const char* kAllReleased =
    "ReleaseInterface IFastTimer\nReleaseInterface ISmux\nReleaseInterface IDriverInterface\n"
    "ReleaseInterface IDiag\nReleaseInterface IPermanentStorage\nReleaseInterface IMultiTask2\n"
    "ReleaseInterface ISerialFactory\nReleaseInterface ISocketFactory\n"
    "ReleaseInterface ICDSBuffer\n";

class ModuleTest : public ::testing::Test {
 protected:
  void SetUp() override { ASSERT_TRUE(plugin_.IsLoaded()) << PluginLibrary::Shared().Error(); }
  void TearDown() override {
    while (inits_ > 0) Close();
    EXPECT_EQ(host_.Complaints(), "");
  }

  int Init(IInterfaceFactory* host) {
    const int result = plugin_.Module()->Init(host);
    inits_ += result != 0 ? 1 : 0;
    return result;
  }
  void Close() {
    --inits_;
    plugin_.Module()->Close();
  }
  std::string Calls() { return host_.Log().Take(); }

  ScriptedHost host_;
  PluginUnderTest plugin_;
  int inits_ = 0;
};

TEST_F(ModuleTest, Identity) {
  IProtModule* module = plugin_.Module();
  EXPECT_STREQ(module->GetImpName(), "ProtModule");
  EXPECT_EQ(module->GetImpVersion(), 100);
  EXPECT_EQ(module->ConvertTo("ProtModule"), module);
  EXPECT_EQ(module->ConvertTo("IProtModule"), module);
  for (const char* name : {"", "protmodule", "IInterface", "IProtModule2"}) {
    EXPECT_EQ(module->ConvertTo(name), nullptr) << name;
  }
}

TEST_F(ModuleTest, AsksAndReleasesInOrder) {
  EXPECT_EQ(Init(&host_), 1);
  EXPECT_EQ(Calls(), kAllAsked);
  Close();
  EXPECT_EQ(Calls(), kAllReleased);
}

TEST_F(ModuleTest, OptionalServicesMayBeAbsent) {
  for (const char* name :
       {"IDiag", "IPermanentStorage", "IDriverInterface", "ISmux", "IFastTimer"}) {
    host_.SetAbsent(name);
  }
  EXPECT_EQ(Init(&host_), 1);
  Calls();
  Close();
  EXPECT_EQ(Calls(),
            "ReleaseInterface IMultiTask2\nReleaseInterface ISerialFactory\n"
            "ReleaseInterface ISocketFactory\nReleaseInterface ICDSBuffer\n");
}

// Each of them alone: the others are still obtained, and exactly these are released.
TEST_F(ModuleTest, EachOptionalServiceMayBeAbsent) {
  for (const std::string name :
       {"IDiag", "IPermanentStorage", "IDriverInterface", "ISmux", "IFastTimer"}) {
    host_.SetAbsent(name);
    EXPECT_EQ(Init(&host_), 1) << name;
    std::string asked = kAllAsked;
    asked.insert(asked.find(name) + name.size(), " -> null");
    EXPECT_EQ(Calls(), asked);
    Close();
    const std::string line = "ReleaseInterface " + name + "\n";
    std::string others = kAllReleased;
    others.erase(others.find(line), line.size());
    EXPECT_EQ(Calls(), others);
    host_.SetPresent(name);
  }
}

struct MissingService {
  const char* service;
  const char* calls;
  const char* text;
};

void PrintTo(const MissingService& missing, std::ostream* out) { *out << missing.service; }

class MissingServiceTest : public ModuleTest,
                           public ::testing::WithParamInterface<MissingService> {};

TEST_P(MissingServiceTest, FailsReleasesAndAsksAgain) {
  host_.SetAbsent(GetParam().service);
  EXPECT_EQ(Init(&host_), 0);
  EXPECT_EQ(Calls(), GetParam().calls);
  EXPECT_STREQ(plugin_.Module()->GetLastError(), GetParam().text);

  // Nothing is bound, so a close has nothing to do.
  plugin_.Module()->Close();
  EXPECT_EQ(Calls(), "");

  host_.SetPresent(GetParam().service);
  EXPECT_EQ(Init(&host_), 1);
  EXPECT_EQ(Calls(), kAllAsked);
  // A success does not clear the text.
  EXPECT_STREQ(plugin_.Module()->GetLastError(), GetParam().text);
}

INSTANTIATE_TEST_SUITE_P(
    Required, MissingServiceTest,
    ::testing::Values(
        MissingService{"IMultiTask2", "CreateInterface IMultiTask2 -> null\n",
                       "IMultiTask2 not created"},
        MissingService{"ISerialFactory",
                       "CreateInterface IMultiTask2\nCreateInterface ISerialFactory -> null\n"
                       "ReleaseInterface IMultiTask2\n",
                       "ISerialFactory not created"},
        MissingService{"ISocketFactory",
                       "CreateInterface IMultiTask2\nCreateInterface ISerialFactory\n"
                       "CreateInterface ISocketFactory -> null\n"
                       "ReleaseInterface IMultiTask2\nReleaseInterface ISerialFactory\n",
                       "ISocketFactory not created"},
        MissingService{"ICDSBuffer",
                       "CreateInterface IMultiTask2\nCreateInterface ISerialFactory\n"
                       "CreateInterface ISocketFactory\nCreateInterface ICDSBuffer -> null\n"
                       "ReleaseInterface IMultiTask2\nReleaseInterface ISerialFactory\n"
                       "ReleaseInterface ISocketFactory\n",
                       "piCDSBuffer not created"}),
    [](const auto& missing) { return std::string(missing.param.service); });

TEST_F(ModuleTest, FurtherInitOnlyCounts) {
  ScriptedHost other;
  EXPECT_EQ(Init(&host_), 1);
  Calls();
  EXPECT_EQ(Init(&other), 1);
  EXPECT_EQ(Init(nullptr), 1);
  EXPECT_EQ(Calls(), "");
  EXPECT_EQ(other.Log().Take(), "");
  Close();
  Close();
  EXPECT_EQ(Calls(), "");
  Close();
  EXPECT_EQ(Calls(), kAllReleased);
  EXPECT_EQ(other.Complaints(), "");
}

TEST_F(ModuleTest, CloseWithoutInitDoesNothing) {
  plugin_.Module()->Close();
  plugin_.Module()->Close();
  EXPECT_EQ(Calls(), "");
  EXPECT_EQ(Init(&host_), 1);
  EXPECT_EQ(Calls(), kAllAsked);
}

TEST_F(ModuleTest, BindsAgainAfterTheLastClose) {
  EXPECT_EQ(Init(&host_), 1);
  Close();
  Calls();
  ScriptedHost other;
  EXPECT_EQ(Init(&other), 1);
  EXPECT_EQ(other.Log().Take(), kAllAsked);
  EXPECT_EQ(Calls(), "");
  Close();
  EXPECT_EQ(other.Log().Take(), kAllReleased);
}

TEST_F(ModuleTest, InitWithoutFactoryFails) {
  EXPECT_EQ(Init(nullptr), 0);
  EXPECT_EQ(Init(&host_), 1);
}

// In a process of its own, since the text of a failed Init stays for the life of the library.
TEST_F(ModuleTest, FirstErrorTextIsEmpty) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");
  EXPECT_EXIT(std::_Exit(plugin_.Module()->GetLastError()[0] == '\0' ? 0 : 1),
              ::testing::ExitedWithCode(0), "");
}

TEST_F(ModuleTest, NextFailureReplacesTheText) {
  host_.SetAbsent("IMultiTask2");
  EXPECT_EQ(Init(&host_), 0);
  host_.SetPresent("IMultiTask2");
  host_.SetAbsent("ICDSBuffer");
  EXPECT_EQ(Init(&host_), 0);
  EXPECT_STREQ(plugin_.Module()->GetLastError(), "piCDSBuffer not created");
}

// A protocol made while no services are bound must do without them.
TEST_F(ModuleTest, ProtocolAfterAFailedInitDoesWithoutServices) {
  host_.SetAbsent("ICDSBuffer");
  ASSERT_EQ(Init(&host_), 0);
  Calls();
  IProtocol* protocol = plugin_.Protocols()->CreateProtocol("LOKA");
  ASSERT_NE(protocol, nullptr);
  EXPECT_NE(protocol->Config("CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 "
                             "stopbits=1 mode=RS-232"),
            0);
  EXPECT_EQ(protocol->Start(), 0);
  EXPECT_STREQ(protocol->GetLastErrorString(), "Can't open serial port");
  EXPECT_NE(protocol->Stop(), 0);
  plugin_.Protocols()->DeleteProtocol(protocol);
  EXPECT_EQ(Calls(), "");
}

}  // namespace
