// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <new>
#include <stdexcept>
#include <string>

#include "interfaces/IProtocol7.h"
#include "protlib/ProtocolBase.h"
#include "tests/unit/FailingNew.h"
#include "tests/unit/FakeDriver.h"

namespace {

void ExpectNoError(const IProtocol& driver) { ExpectError(driver, 1, ""); }

}  // namespace

// --- identity ---

TEST(ProtocolBaseTest, AnswersToAllItsNames) {
  FakeDriver driver;
  for (const char* name : {"ProtocolBase", "IProtocol7", "IProtocol6", "IProtocol5", "IProtocol4",
                           "IProtocol3", "IProtocol2", "IProtocol"}) {
    EXPECT_EQ(driver.ConvertTo(name), &driver) << name;
  }
}

TEST(ProtocolBaseTest, AllVersionsShareOneAddress) {
  FakeDriver driver;
  IProtocol7* const newest = &driver;
  EXPECT_EQ(static_cast<void*>(static_cast<IProtocol*>(newest)), static_cast<void*>(&driver));
  EXPECT_EQ(static_cast<void*>(static_cast<IInterface*>(newest)), static_cast<void*>(&driver));
}

TEST(ProtocolBaseTest, AnswersToNoOtherName) {
  FakeDriver driver;
  for (const char* name :
       {"", "IProtocol8", "IProtocol1", "iprotocol", "IProtocol ", "FakeDriver", "IInterface"}) {
    EXPECT_EQ(driver.ConvertTo(name), nullptr) << name;
  }
  EXPECT_EQ(driver.ConvertTo(nullptr), nullptr);
}

TEST(ProtocolBaseTest, IdentIsTheNameUntilOneIsSet) {
  FakeDriver driver;
  EXPECT_STREQ(driver.GetIdent(), "FAKE");
  driver.SetIdent("line 3");
  EXPECT_STREQ(driver.GetIdent(), "line 3");
  driver.SetIdent("");
  EXPECT_STREQ(driver.GetIdent(), "FAKE");
  driver.SetIdent("again");
  driver.SetIdent(nullptr);
  EXPECT_STREQ(driver.GetIdent(), "FAKE");
}

TEST(ProtocolBaseTest, IdentIsCopied) {
  FakeDriver driver;
  std::string ident = "an identifier that is longer than a small string";
  driver.SetIdent(ident.c_str());
  ident.assign(ident.size(), 'x');
  EXPECT_STREQ(driver.GetIdent(), "an identifier that is longer than a small string");
}

TEST(ProtocolBaseTest, NextInstanceHasTheDriversName) {
  FakeDriver driver;
  driver.SetIdent("line 3");
  EXPECT_STREQ(driver.GetNextInstanceName(), "FAKE");
}

// --- error state ---

TEST(ProtocolBaseTest, StartsWithoutAnError) { ExpectNoError(FakeDriver()); }

TEST(ProtocolBaseTest, OnlyTheLastErrorRemains) {
  const FakeDriver driver;
  driver.RecordError(-1, "first");
  driver.RecordError(-9, "second");
  ExpectError(driver, -9, "second");
}

TEST(ProtocolBaseTest, SuccessDoesNotClearTheError) {
  FakeDriver driver;
  driver.RecordError(-1, "first");
  EXPECT_NE(driver.Start(), 0);
  unsigned char value[4];
  const FakeTag tag("int");
  EXPECT_NE(driver.Read(&tag, value), 0);
  ExpectError(driver, -1, "first");
}

TEST(ProtocolBaseTest, ErrorTextStaysReadableWhileOthersFail) {
  const FakeDriver driver;
  driver.RecordError(-1, "the text that a host is still reading");
  const std::string expected = driver.GetLastErrorString();
  const char* const held = driver.GetLastErrorString();
  for (int i = 0; i < 15; ++i) driver.RecordError(-3, "another text that is longer than that one");
  EXPECT_EQ(held, expected);
}

TEST(ProtocolBaseTest, TagErrorNamesTheTag) {
  const FakeDriver driver;
  FakeTag tag("int");
  tag.uri = "Tag1";
  tag.SetError("memorytype field missing");
  driver.RecordTagError(&tag);
  ExpectError(driver, -1, "Tag URI error: Tag1 - memorytype field missing");
}

TEST(ProtocolBaseTest, GuardedTurnsExceptionsIntoAnError) {
  const FakeDriver driver;
  EXPECT_EQ(driver.RunGuarded(-7, []() -> int { throw std::bad_alloc(); }), -7);
  ExpectError(driver, -1, "Out of memory");
}

TEST(ProtocolBaseTest, GuardedGivesTheResultOfTheBody) {
  const FakeDriver driver;
  EXPECT_EQ(driver.RunGuarded(-7, [] { return -7; }), -7);
  EXPECT_EQ(driver.RunGuarded(0, [] { return 3; }), 3);
  ExpectNoError(driver);
}

TEST(ProtocolBaseTest, IdentThatDoesNotFitIntoMemoryIsAnError) {
  FakeDriver driver;
  driver.SetIdent("old");
  const std::string ident(200, 'x');
  {
    const FailingNew noMemory(1);
    driver.SetIdent(ident.c_str());
  }
  EXPECT_STREQ(driver.GetIdent(), "old");
  ExpectError(driver, -1, "Out of memory");
}

// --- neutral answers, without a trace in the error state ---

TEST(ProtocolBaseTest, AnswersNeutrally) {
  FakeDriver fake;
  IProtocol7& driver = fake;
  const FakeTag tag("int");
  const ITag* const tags[] = {&tag};
  unsigned char buffer[4] = {9, 9, 9, 9};
  idal_error_t status[1] = {77};
  unsigned long long last = 88;

  EXPECT_EQ(driver.Start(), 1);
  EXPECT_EQ(driver.Stop(), 1);
  EXPECT_EQ(driver.MaxDatagramItems(&tag), 0);
  EXPECT_EQ(driver.MaxDatagramLength(&tag), 0);
  EXPECT_FALSE(driver.CanCoexistInDatagram(&tag, &tag));
  EXPECT_EQ(driver.ReadDatagram(tags, 1, buffer), 0);
  EXPECT_EQ(driver.GetXml(), nullptr);
  EXPECT_FALSE(driver.IsConverted());
  EXPECT_EQ(driver.Extend(0, buffer), 0);
  EXPECT_EQ(driver.Extend(3, buffer), 0);
  EXPECT_FALSE(driver.CanAddToDatagram(tags, 1, &tag));
  EXPECT_EQ(driver.ReadDatagramWithStatus(tags, 1, buffer, status), 0);
  EXPECT_FALSE(driver.MultipleReadSupported());
  EXPECT_EQ(driver.MultipleRead(nullptr), 0);
  EXPECT_FALSE(driver.MultipleWriteSupported());
  EXPECT_EQ(driver.MultipleWrite(nullptr), 0);
  EXPECT_FALSE(driver.CanReadBitBlock(&tag));
  EXPECT_EQ(driver.ReadBitBlock(&tag, buffer, 8), 0);
  EXPECT_EQ(driver.GetInterface("IProtocol"), nullptr);
  EXPECT_EQ(driver.MaxUnusedGap(&tag), 16777215);
  EXPECT_FALSE(driver.NeedsReadBeforeWrite(&tag));
  EXPECT_FALSE(driver.CanWriteDatagrams(&tag));
  EXPECT_FALSE(driver.CanAddToWriteDatagram(tags, 1, &tag));
  EXPECT_EQ(driver.WriteDatagramWithStatus(tags, 1, buffer, status), 0);
  EXPECT_FALSE(driver.CanWriteBitBlock(&tag));
  EXPECT_EQ(driver.WriteBitBlock(&tag, buffer, 8), 0);
  EXPECT_EQ(driver.vcsGetCapability(), 0);
  EXPECT_EQ(driver.vcsGetComParams(reinterpret_cast<char*>(buffer), 4), 0);
  EXPECT_EQ(driver.vcsActivateInterleaved(1), 0);
  driver.deleteEventChannel(nullptr);
  EXPECT_EQ(driver.frontEvent(nullptr), nullptr);
  driver.popEvent(nullptr);
  driver.deleteAlarm(nullptr);
  EXPECT_EQ(driver.listAlarms(nullptr), 0);
  EXPECT_EQ(driver.quitAlarm(nullptr), 0);
  driver.deleteTrend(nullptr);
  EXPECT_EQ(driver.readTrend(nullptr, 1, 2, last, 3, true, nullptr), 0);
  EXPECT_FALSE(driver.hasPlcTimestamp(&tag));
  EXPECT_EQ(driver.getTagUriFieldCount(), 0);
  EXPECT_EQ(driver.getTagUriFieldName(0), nullptr);
  EXPECT_EQ(driver.getTagUriFieldPosition("node"), -1);

  ExpectNoError(driver);
  EXPECT_EQ(Bytes(buffer, buffer + 4), Bytes(4, 9));
  EXPECT_EQ(status[0], 77);
  EXPECT_EQ(last, 88U);
}

TEST(ProtocolBaseTest, DriversOwnListOfUriNamesIsEmpty) {
  const FakeDriver driver;
  ASSERT_NE(driver.tagUriNames(), nullptr);
  EXPECT_EQ(driver.tagUriNames()[0], nullptr);
}

// --- operations that leave a reason ---

TEST(ProtocolBaseTest, BlockWritesAreNotPossible) {
  FakeDriver driver;
  const FakeTag tag("int");
  const Bytes value(4);
  EXPECT_EQ(driver.WriteBlock(&tag, value.data(), 4), 0);
  ExpectError(driver, -3, "Optimized writing not supported");
}

TEST(ProtocolBaseTest, ObjectsAreNotSupported) {
  FakeDriver driver;
  const FakeTag tag("object");
  EXPECT_FALSE(driver.readObject(&tag, nullptr));
  ExpectError(driver, -1, "read object not supported");
  EXPECT_FALSE(driver.writeObject(&tag, nullptr));
  ExpectError(driver, -1, "write object not supported");
}

TEST(ProtocolBaseTest, EventChannelsAreNotSupported) {
  const auto expectRefusal = [](auto operation) {
    FakeDriver driver;
    EXPECT_FALSE(operation(driver));
    ExpectError(driver, -1, "protocol does not support event channel");
  };
  expectRefusal([](FakeDriver& driver) { return driver.createEventChannel(1) != nullptr; });
  expectRefusal([](FakeDriver& driver) {
    return driver.createEventChannel(static_cast<IEventProcessor*>(nullptr)) != nullptr;
  });
  expectRefusal([](FakeDriver& driver) { return driver.addEventSource(nullptr, "x") != 0; });
  expectRefusal([](FakeDriver& driver) { return driver.addAlarmEvents(nullptr, nullptr) != 0; });
}

TEST(ProtocolBaseTest, AlarmsAreNotSupported) {
  FakeDriver driver;
  EXPECT_EQ(driver.createAlarm("x"), nullptr);
  ExpectError(driver, -1, "protocol does not support alarms");
}

TEST(ProtocolBaseTest, TrendsAreNotSupported) {
  FakeDriver driver;
  EXPECT_EQ(driver.createTrend("x"), nullptr);
  ExpectError(driver, -1, "protocol does not support trends");
}
