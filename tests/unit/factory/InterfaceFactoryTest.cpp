// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "factory/InterfaceFactory.h"
#include "interfaces/IProtocol.h"
#include "tests/unit/FailingNew.h"

extern "C" IInterfaceFactory* GetInterfaceFactory();

TEST(InterfaceFactoryTest, EntryPointGivesOneFactory) {
  ASSERT_NE(GetInterfaceFactory(), nullptr);
  EXPECT_EQ(GetInterfaceFactory(), GetInterfaceFactory());
}

TEST(InterfaceFactoryTest, HandsOutItsTwoInterfacesByEitherName) {
  InterfaceFactory factory;
  IInterface* const protocols = factory.CreateInterface("IProtocolFactory");
  ASSERT_NE(protocols, nullptr);
  EXPECT_EQ(factory.CreateInterface("ProtocolFactory"), protocols);
  EXPECT_EQ(factory.CreateInterface("IProtocolFactory"), protocols);
  EXPECT_EQ(protocols->ConvertTo("IProtocolFactory"), protocols);

  IInterface* const module = factory.CreateInterface("IProtModule");
  ASSERT_NE(module, nullptr);
  EXPECT_NE(module, protocols);
  EXPECT_EQ(factory.CreateInterface("ProtModule"), module);
  EXPECT_EQ(module->ConvertTo("IProtModule"), module);
}

TEST(InterfaceFactoryTest, HandsOutNothingElse) {
  InterfaceFactory factory;
  for (const char* name : {"", "iprotocolfactory", "IProtocolFactory ", " IProtModule",
                           "protmodule", "IInterfaceFactory", "LOKA"}) {
    EXPECT_EQ(factory.CreateInterface(name), nullptr) << name;
  }
  EXPECT_EQ(factory.CreateInterface(nullptr), nullptr);
}

TEST(InterfaceFactoryTest, ReleasingChangesNothing) {
  InterfaceFactory factory;
  IInterface* const protocols = factory.CreateInterface("IProtocolFactory");
  factory.ReleaseInterface(protocols);
  factory.ReleaseInterface(protocols);
  factory.ReleaseInterface(nullptr);
  EXPECT_EQ(factory.CreateInterface("IProtocolFactory"), protocols);
  EXPECT_EQ(protocols->ConvertTo("ProtocolFactory"), protocols);
}

TEST(InterfaceFactoryTest, AsksForNoMemory) {
  const long long before = FailingNew::Count();
  IInterfaceFactory* const factory = GetInterfaceFactory();
  for (const char* name : {"IProtocolFactory", "ProtModule", "a name that nobody knows at all"}) {
    factory->ReleaseInterface(factory->CreateInterface(name));
  }
  EXPECT_EQ(FailingNew::Count(), before);
}
