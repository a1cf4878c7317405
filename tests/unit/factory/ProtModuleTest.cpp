// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "factory/ProtModule.h"
#include "interfaces/IInterfaceFactory.h"
#include "protlib/HostInterfaces.h"
#include "tests/support/ScriptedHost.h"
#include "tests/unit/FailingNew.h"

namespace {

const char* const kAskedRequired =
    "CreateInterface IMultiTask2\nCreateInterface ISerialFactory\nCreateInterface ISocketFactory\n"
    "CreateInterface ICDSBuffer\n";
const char* const kAskedOptional =
    "CreateInterface IDiag\nCreateInterface IPermanentStorage\nCreateInterface IDriverInterface\n"
    "CreateInterface ISmux\nCreateInterface IFastTimer\n";
const char* const kReleased =
    "ReleaseInterface IFastTimer\nReleaseInterface ISmux\nReleaseInterface IDriverInterface\n"
    "ReleaseInterface IDiag\nReleaseInterface IPermanentStorage\nReleaseInterface IMultiTask2\n"
    "ReleaseInterface ISerialFactory\nReleaseInterface ISocketFactory\n"
    "ReleaseInterface ICDSBuffer\n";

void ExpectNoServices() {
  EXPECT_EQ(piMultiTask, nullptr);
  EXPECT_EQ(piSerialFactory, nullptr);
  EXPECT_EQ(piSocketFactory, nullptr);
  EXPECT_EQ(piCDSBuffer, nullptr);
  EXPECT_EQ(piDiag, nullptr);
  EXPECT_EQ(piPermanentStorage, nullptr);
  EXPECT_EQ(piDriverInterface, nullptr);
  EXPECT_EQ(piSmux, nullptr);
  EXPECT_EQ(piFastTimer, nullptr);
}

class ProtModuleTest : public testing::Test {
 protected:
  ~ProtModuleTest() override { EXPECT_EQ(host_.Complaints(), ""); }

  ScriptedHost host_;
  ProtModule module_;
};

}  // namespace

TEST_F(ProtModuleTest, AnswersToItsNames) {
  EXPECT_EQ(module_.ConvertTo("ProtModule"), &module_);
  EXPECT_EQ(module_.ConvertTo("IProtModule"), &module_);
  for (const char* name : {"", "protmodule", "IInterface"}) {
    EXPECT_EQ(module_.ConvertTo(name), nullptr) << name;
  }
  EXPECT_EQ(module_.ConvertTo(nullptr), nullptr);
  EXPECT_STREQ(module_.GetImpName(), "ProtModule");
  EXPECT_EQ(module_.GetImpVersion(), 100);
  EXPECT_STREQ(module_.GetLastError(), "");
}

TEST_F(ProtModuleTest, InitObtainsEveryServiceInOrder) {
  EXPECT_EQ(module_.Init(&host_), 1);
  EXPECT_EQ(host_.Log().Take(), std::string(kAskedRequired) + kAskedOptional);
  EXPECT_EQ(piMultiTask, &host_.MultiTask());
  EXPECT_EQ(piSerialFactory, &host_.SerialFactory());
  EXPECT_EQ(piPermanentStorage, &host_.Storage());
  EXPECT_NE(piSocketFactory, nullptr);
  EXPECT_NE(piCDSBuffer, nullptr);
  EXPECT_NE(piDiag, nullptr);
  EXPECT_NE(piDriverInterface, nullptr);
  EXPECT_NE(piSmux, nullptr);
  EXPECT_NE(piFastTimer, nullptr);
  module_.Close();
}

TEST_F(ProtModuleTest, CloseReleasesEveryServiceInOrder) {
  module_.Init(&host_);
  host_.Log().Take();
  module_.Close();
  EXPECT_EQ(host_.Log().Take(), kReleased);
  ExpectNoServices();
}

TEST_F(ProtModuleTest, FurtherInitsOnlyCount) {
  ScriptedHost another;
  EXPECT_EQ(module_.Init(&host_), 1);
  host_.Log().Take();
  EXPECT_EQ(module_.Init(&another), 1);
  EXPECT_EQ(module_.Init(nullptr), 1);
  EXPECT_EQ(another.Log().Text(), "");
  module_.Close();
  module_.Close();
  EXPECT_EQ(host_.Log().Text(), "");
  EXPECT_EQ(piMultiTask, &host_.MultiTask());
  module_.Close();
  EXPECT_EQ(host_.Log().Take(), kReleased);
}

TEST_F(ProtModuleTest, CloseWithoutInitDoesNothing) {
  module_.Close();
  EXPECT_EQ(host_.Log().Text(), "");
  EXPECT_EQ(module_.Init(&host_), 1);
  module_.Close();
  host_.Log().Take();
  module_.Close();
  EXPECT_EQ(host_.Log().Text(), "");
}

TEST_F(ProtModuleTest, MissingServiceFailsTheInit) {
  const struct {
    const char* service;
    const char* message;
    const char* log;
  } cases[] = {
      {"IMultiTask2", "IMultiTask2 not created", "CreateInterface IMultiTask2 -> null\n"},
      {"ISerialFactory", "ISerialFactory not created",
       "CreateInterface IMultiTask2\nCreateInterface ISerialFactory -> null\n"
       "ReleaseInterface IMultiTask2\n"},
      {"ISocketFactory", "ISocketFactory not created",
       "CreateInterface IMultiTask2\nCreateInterface ISerialFactory\n"
       "CreateInterface ISocketFactory -> null\n"
       "ReleaseInterface IMultiTask2\nReleaseInterface ISerialFactory\n"},
      {"ICDSBuffer", "piCDSBuffer not created",
       "CreateInterface IMultiTask2\nCreateInterface ISerialFactory\n"
       "CreateInterface ISocketFactory\nCreateInterface ICDSBuffer -> null\n"
       "ReleaseInterface IMultiTask2\nReleaseInterface ISerialFactory\n"
       "ReleaseInterface ISocketFactory\n"},
  };
  for (const auto& missing : cases) {
    host_.SetAbsent(missing.service);
    EXPECT_EQ(module_.Init(&host_), 0);
    EXPECT_STREQ(module_.GetLastError(), missing.message);
    EXPECT_EQ(host_.Log().Take(), missing.log);
    ExpectNoServices();
    module_.Close();
    EXPECT_EQ(host_.Log().Take(), "");
    host_.SetPresent(missing.service);
  }
}

TEST_F(ProtModuleTest, InitAfterAFailureAsksEverythingAgain) {
  host_.SetAbsent("ISocketFactory");
  EXPECT_EQ(module_.Init(&host_), 0);
  host_.SetPresent("ISocketFactory");
  host_.Log().Take();
  EXPECT_EQ(module_.Init(&host_), 1);
  EXPECT_EQ(host_.Log().Take(), std::string(kAskedRequired) + kAskedOptional);
  // A success does not clear the text.
  EXPECT_STREQ(module_.GetLastError(), "ISocketFactory not created");
  module_.Close();
}

TEST_F(ProtModuleTest, OptionalServicesMayBeMissing) {
  for (const char* service :
       {"IDiag", "IPermanentStorage", "IDriverInterface", "ISmux", "IFastTimer"}) {
    host_.SetAbsent(service);
  }
  EXPECT_EQ(module_.Init(&host_), 1);
  EXPECT_EQ(piDiag, nullptr);
  EXPECT_EQ(piPermanentStorage, nullptr);
  EXPECT_EQ(piDriverInterface, nullptr);
  EXPECT_EQ(piSmux, nullptr);
  EXPECT_EQ(piFastTimer, nullptr);
  host_.Log().Take();
  module_.Close();
  EXPECT_EQ(host_.Log().Take(),
            "ReleaseInterface IMultiTask2\nReleaseInterface ISerialFactory\n"
            "ReleaseInterface ISocketFactory\nReleaseInterface ICDSBuffer\n");
}

TEST_F(ProtModuleTest, HostWithoutAFactoryHasNoServices) {
  EXPECT_EQ(module_.Init(nullptr), 0);
  EXPECT_STREQ(module_.GetLastError(), "IMultiTask2 not created");
}

TEST_F(ProtModuleTest, EndReleasesWhatWasNeverClosed) {
  {
    ProtModule module;
    EXPECT_EQ(module.Init(&host_), 1);
    host_.Log().Take();
  }
  EXPECT_EQ(host_.Log().Take(), kReleased);
  ExpectNoServices();
}

TEST_F(ProtModuleTest, EndDoesNotReleaseTwice) {
  {
    ProtModule module;
    EXPECT_EQ(module.Init(&host_), 1);
    module.Close();
    host_.Log().Take();
  }
  EXPECT_EQ(host_.Log().Take(), "");
}

TEST_F(ProtModuleTest, FailureWithoutMemoryForItsTextDoesNotEscape) {
  // Refuses everything and allocates nothing.
  class EmptyHost final : public IInterfaceFactory {
   public:
    IInterface* CreateInterface(const char* /*name*/) override { return nullptr; }
    void ReleaseInterface(IInterface* /*interface*/) override {}
  };
  EmptyHost host;
  {
    const FailingNew noMemory(1);
    EXPECT_EQ(module_.Init(&host), 0);
    EXPECT_TRUE(noMemory.HasFailed());
  }
  EXPECT_STREQ(module_.GetLastError(), "");
  EXPECT_EQ(module_.Init(&host), 0);
  EXPECT_STREQ(module_.GetLastError(), "IMultiTask2 not created");
}
