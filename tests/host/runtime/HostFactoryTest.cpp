// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/port/PosixSerialFactory.h"
#include "host/runtime/HostFactory.h"
#include "host/runtime/PosixMultiTask.h"
#include "host/store/SqliteStorage.h"
#include "tests/host/support/TemporaryFolder.h"

namespace {

class HostFactoryTest : public testing::Test {
 protected:
  PosixMultiTask multiTask_;
  PosixSerialFactory serialFactory_{PortMap(), nullptr};
};

TEST_F(HostFactoryTest, OffersTheRequiredServicesUnderTheirNames) {
  HostFactory factory(&multiTask_, &serialFactory_, nullptr);
  for (const char* const name : {"IMultiTask2", "ISerialFactory", "ISocketFactory", "ICDSBuffer"}) {
    IInterface* const service = factory.CreateInterface(name);
    ASSERT_NE(service, nullptr) << name;
    auto* const named = static_cast<INamedInterface*>(service->ConvertTo(name));
    ASSERT_NE(named, nullptr) << name;
    EXPECT_EQ(named->GetImpVersion(), 100);
    EXPECT_STREQ(
        static_cast<INamedInterface*>(service->ConvertTo(named->GetImpName()))->GetImpName(),
        named->GetImpName());
    EXPECT_EQ(service->ConvertTo("IInterface"), nullptr);
  }
  EXPECT_EQ(factory.LentCount(), 4);
}

TEST_F(HostFactoryTest, HasNothingUnderOtherNames) {
  HostFactory factory(&multiTask_, &serialFactory_, nullptr);
  for (const char* const name :
       {"IDiag", "IDriverInterface", "ISmux", "IFastTimer", "imultitask2", "IMultiTask2 ", ""}) {
    EXPECT_EQ(factory.CreateInterface(name), nullptr) << name;
  }
  EXPECT_EQ(factory.CreateInterface(nullptr), nullptr);
  EXPECT_EQ(factory.LentCount(), 0);
}

TEST_F(HostFactoryTest, OffersStorageOnlyWhenThereIsOne) {
  HostFactory without(&multiTask_, &serialFactory_, nullptr);
  EXPECT_EQ(without.CreateInterface("IPermanentStorage"), nullptr);

  const TemporaryFolder folder;
  std::string error;
  const auto storage = SqliteStorage::Open(folder.File("store.db"), nullptr, &error);
  ASSERT_NE(storage, nullptr) << error;
  HostFactory with(&multiTask_, &serialFactory_, storage.get());
  IInterface* const service = with.CreateInterface("IPermanentStorage");
  ASSERT_EQ(service, storage.get());
  EXPECT_EQ(service->ConvertTo("IPermanentStorage2"), storage.get());
}

TEST_F(HostFactoryTest, CountsWhatIsTakenBack) {
  HostFactory factory(&multiTask_, &serialFactory_, nullptr);
  factory.ReleaseInterface(factory.CreateInterface("IMultiTask2"));
  factory.ReleaseInterface(nullptr);
  EXPECT_EQ(factory.LentCount(), 0);
}

}  // namespace
