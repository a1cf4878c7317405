// SPDX-License-Identifier: Apache-2.0
// The exported entry point, the interface factory and the protocol factory.
#include <dlfcn.h>

#include <cstdio>
#include <filesystem>
#include <fstream>

#include "tests/plugin/PluginFixture.h"

namespace {

class EntryTest : public PluginFixture {
 protected:
  IInterfaceFactory* factory() const { return plugin_.Factory(); }
};

TEST_F(EntryTest, EveryCallGivesTheSameFactory) {
  const auto getFactory = reinterpret_cast<GetInterfaceFactoryFunction>(
      PluginLibrary::Shared().Symbol("GetInterfaceFactory"));
  ASSERT_NE(getFactory, nullptr);
  EXPECT_NE(getFactory(), nullptr);
  EXPECT_EQ(getFactory(), getFactory());
}

TEST_F(EntryTest, FactoryKnowsFourNames) {
  IInterface* protocols = factory()->CreateInterface("IProtocolFactory");
  IInterface* module = factory()->CreateInterface("IProtModule");
  ASSERT_NE(protocols, nullptr);
  ASSERT_NE(module, nullptr);
  EXPECT_NE(protocols, module);
  EXPECT_EQ(factory()->CreateInterface("ProtocolFactory"), protocols);
  EXPECT_EQ(factory()->CreateInterface("ProtModule"), module);
  EXPECT_EQ(factory()->CreateInterface("IProtocolFactory"), protocols);
  EXPECT_EQ(factory()->CreateInterface("IProtModule"), module);
}

TEST_F(EntryTest, NamesMatchExactly) {
  for (const char* name :
       {"", "iprotocolfactory", "IProtocolFactory ", " IProtocolFactory", "IProtocolFactor",
        "IProtocolFactory2", "IPROTMODULE", "iprotmodule", "IProtModule ", "IInterface", "LOKA"}) {
    EXPECT_EQ(factory()->CreateInterface(name), nullptr) << name;
  }
  EXPECT_EQ(factory()->CreateInterface(nullptr), nullptr);
}

TEST_F(EntryTest, ReleaseLeavesTheObjectUsable) {
  IInterface* protocols = factory()->CreateInterface("IProtocolFactory");
  factory()->ReleaseInterface(protocols);
  factory()->ReleaseInterface(protocols);
  factory()->ReleaseInterface(nullptr);
  EXPECT_EQ(factory()->CreateInterface("IProtocolFactory"), protocols);
  EXPECT_STREQ(plugin_.Protocols()->GetImpName(), "ProtFactoryInDLL");
}

TEST_F(EntryTest, ProtocolFactoryIdentity) {
  IProtocolFactory* protocols = plugin_.Protocols();
  EXPECT_STREQ(protocols->GetImpName(), "ProtFactoryInDLL");
  EXPECT_EQ(protocols->GetImpVersion(), 100);
  EXPECT_EQ(protocols->ConvertTo("IProtocolFactory"), protocols);
  EXPECT_EQ(protocols->ConvertTo("ProtocolFactory"), protocols);
  for (const char* name : {"", "IInterface", "IProtModule", "protocolfactory"}) {
    EXPECT_EQ(protocols->ConvertTo(name), nullptr) << name;
  }
  EXPECT_EQ(protocols->ConvertTo(nullptr), nullptr);
}

TEST_F(EntryTest, OnlyTheExactProtocolNameIsCreated) {
  for (const char* name : {"", "loka", "LOKA ", " LOKA", "LOK", "LOKA2", "Loka"}) {
    EXPECT_EQ(plugin_.Protocols()->CreateProtocol(name), nullptr) << name;
  }
  EXPECT_EQ(plugin_.Protocols()->CreateProtocol(nullptr), nullptr);
  EXPECT_EQ(host_.Log().Take(), "");
}

TEST_F(EntryTest, TwoProtocolsAreIndependent) {
  ProtocolUnderTest first(plugin_);
  ProtocolUnderTest second(plugin_);
  EXPECT_NE(first.Get(), second.Get());
  EXPECT_EQ(host_.Log().Take(),
            "CreateSemaphore -> queue\nCreateSemaphore -> port\n"
            "CreateSemaphore -> queue2\nCreateSemaphore -> port2\n");
  first->SetIdent("one");
  EXPECT_STREQ(second->GetIdent(), "LOKA");
  EXPECT_FALSE(first.Config("CfgVer=2"));
  EXPECT_EQ(second.Error(), "1 ");
}

TEST_F(EntryTest, DeletingNullIsHarmless) {
  plugin_.Protocols()->DeleteProtocol(nullptr);
  EXPECT_EQ(host_.Log().Take(), "");
}

TEST_F(EntryTest, DeleteGoesThroughTheObject) {
  {
    ProtocolUnderTest protocol(plugin_);
    host_.Log().Take();
  }
  EXPECT_EQ(host_.Log().Take(), "DeleteSemaphore queue\nDeleteSemaphore port\n");
}

// A copy under another name is a library of its own, which can be unloaded without touching the one
// that the other tests use.
class UnloadTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_EQ(PluginLibrary::Shared().Error(), "");
    copy_ =
        std::filesystem::temp_directory_path() /
        ("loka_unload_" + std::to_string(reinterpret_cast<std::uintptr_t>(this)) + "_" +
         std::to_string(std::filesystem::file_time_type::clock::now().time_since_epoch().count()) +
         ".so");
    std::filesystem::copy_file(PluginLibrary::DefaultPath(), copy_);
  }
  void TearDown() override { std::filesystem::remove(copy_); }

  std::filesystem::path copy_;
  ScriptedHost host_;
};

TEST_F(UnloadTest, ReleasesWhatTheHostNeverClosed) {
  {
    PluginLibrary library(copy_.string());
    ASSERT_NE(library.Factory(), nullptr) << library.Error();
    auto* module = static_cast<IProtModule*>(
        library.Factory()->CreateInterface("IProtModule")->ConvertTo("IProtModule"));
    ASSERT_EQ(module->Init(&host_), 1);
    host_.Log().Take();
  }
  ASSERT_EQ(dlopen(copy_.c_str(), RTLD_NOW | RTLD_NOLOAD), nullptr) << "the library stayed loaded";
  EXPECT_EQ(host_.Log().Take(),
            "ReleaseInterface IFastTimer\nReleaseInterface ISmux\n"
            "ReleaseInterface IDriverInterface\nReleaseInterface IDiag\n"
            "ReleaseInterface IPermanentStorage\nReleaseInterface IMultiTask2\n"
            "ReleaseInterface ISerialFactory\nReleaseInterface ISocketFactory\n"
            "ReleaseInterface ICDSBuffer\n");
  EXPECT_EQ(host_.Complaints(), "");
}

TEST_F(UnloadTest, ReleasesNothingAfterTheLastClose) {
  {
    PluginLibrary library(copy_.string());
    ASSERT_NE(library.Factory(), nullptr) << library.Error();
    auto* module = static_cast<IProtModule*>(
        library.Factory()->CreateInterface("IProtModule")->ConvertTo("IProtModule"));
    ASSERT_EQ(module->Init(&host_), 1);
    module->Close();
    host_.Log().Take();
  }
  EXPECT_EQ(host_.Log().Take(), "");
  EXPECT_EQ(host_.Complaints(), "");
}

// The release at unload happens with exactly one use left, as in Close.
TEST_F(UnloadTest, ReleasesNothingWithTwoUsesLeft) {
  {
    PluginLibrary library(copy_.string());
    ASSERT_NE(library.Factory(), nullptr) << library.Error();
    auto* module = static_cast<IProtModule*>(
        library.Factory()->CreateInterface("IProtModule")->ConvertTo("IProtModule"));
    ASSERT_EQ(module->Init(&host_), 1);
    ASSERT_EQ(module->Init(&host_), 1);
    host_.Log().Take();
  }
  EXPECT_EQ(host_.Log().Take(), "");
}

}  // namespace
