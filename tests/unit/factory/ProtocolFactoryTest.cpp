// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "factory/ProtocolFactory.h"
#include "interfaces/IProtocol.h"
#include "tests/unit/FailingNew.h"
#include "tests/unit/FakeDriver.h"
#include "tests/unit/HostInUse.h"
#include "tests/unit/QuietHost.h"

TEST(ProtocolFactoryTest, AnswersToItsNames) {
  ProtocolFactory factory;
  EXPECT_EQ(factory.ConvertTo("ProtocolFactory"), &factory);
  EXPECT_EQ(factory.ConvertTo("IProtocolFactory"), &factory);
  for (const char* name : {"", "protocolfactory", "IInterface", "ProtFactoryInDLL"}) {
    EXPECT_EQ(factory.ConvertTo(name), nullptr) << name;
  }
  EXPECT_EQ(factory.ConvertTo(nullptr), nullptr);
  EXPECT_STREQ(factory.GetImpName(), "ProtFactoryInDLL");
  EXPECT_EQ(factory.GetImpVersion(), 100);
}

TEST(ProtocolFactoryTest, CreatesIndependentProtocols) {
  HostInUse host;
  ProtocolFactory factory;
  IProtocol* const first = factory.CreateProtocol("LOKA");
  IProtocol* const second = factory.CreateProtocol("LOKA");
  ASSERT_NE(first, nullptr);
  ASSERT_NE(second, nullptr);
  EXPECT_NE(first, second);
  first->SetIdent("first");
  EXPECT_STREQ(second->GetIdent(), "LOKA");
  factory.DeleteProtocol(first);
  EXPECT_STREQ(second->GetName(), "LOKA");
  factory.DeleteProtocol(second);
  EXPECT_EQ(host->Complaints(), "");
}

TEST(ProtocolFactoryTest, CreatesNothingElse) {
  HostInUse host;
  ProtocolFactory factory;
  for (const char* name : {"", "loka", "LOKA ", " LOKA", "Loka Serial", "Protocol_LOKA"}) {
    EXPECT_EQ(factory.CreateProtocol(name), nullptr) << name;
  }
  EXPECT_EQ(factory.CreateProtocol(nullptr), nullptr);
  EXPECT_EQ(host->Log().Text(), "");
}

TEST(ProtocolFactoryTest, DeletingNothingDoesNothing) {
  ProtocolFactory factory;
  factory.DeleteProtocol(nullptr);
}

// No list of its own protocols stands in the way: the object's own destructor does it.
TEST(ProtocolFactoryTest, DeletesWhateverItIsGiven) {
  class Leaving final : public FakeDriver {
   public:
    explicit Leaving(bool& isGone) : isGone_(isGone) {}
    ~Leaving() override { isGone_ = true; }
    Leaving(const Leaving&) = delete;
    Leaving& operator=(const Leaving&) = delete;

   private:
    bool& isGone_;
  };
  bool isGone = false;
  ProtocolFactory factory;
  factory.DeleteProtocol(new Leaving(isGone));
  EXPECT_TRUE(isGone);
}

TEST(ProtocolFactoryTest, WithoutMemoryThereIsNoProtocol) {
  QuietHost host;
  ProtocolFactory factory;
  for (int nth = 1;; ++nth) {
    const FailingNew noMemory(nth);
    IProtocol* const protocol = factory.CreateProtocol("LOKA");
    if (!noMemory.HasFailed()) {
      EXPECT_GT(nth, 1);
      ASSERT_NE(protocol, nullptr);
      factory.DeleteProtocol(protocol);
      break;
    }
    EXPECT_EQ(protocol, nullptr) << nth;
    EXPECT_EQ(host.Outstanding(), 0) << nth;
  }
  EXPECT_EQ(host.Outstanding(), 0);
}
