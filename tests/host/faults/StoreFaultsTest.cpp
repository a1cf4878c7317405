// SPDX-License-Identifier: Apache-2.0
// The store is full, read-only, damaged or locked, before the start and while "loka run" runs.
#include <gtest/gtest.h>
#include <sqlite3.h>
#include <sys/stat.h>

#include <fstream>
#include <iterator>
#include <optional>

#include "host/port/PseudoTerminal.h"
#include "host/store/SqliteFile.h"
#include "host/text/ByteText.h"
#include "tests/host/faults/OtherUser.h"
#include "tests/host/faults/RunBench.h"
#include "tests/host/faults/SmallFileSystem.h"

namespace {

using Json = nlohmann::json;

constexpr const char* kHeldInMemory = "the values hold until the program ends";

class StoreFaults : public testing::Test {
 protected:
  // Stages and applies a gap through the control socket; the whole answer.
  Json SetGap(int gapMs) const {
    ControlClient client(bench_.SocketFile());
    const Json stage = {{"op", "stage"}, {"key", "gap"}, {"value", std::to_string(gapMs)}};
    const Json staged = client.Ask(stage.dump());
    return staged.value("ok", false) ? client.Ask(R"({"op":"done"})") : staged;
  }
  static bool IsStored(const Json& answer) {
    return answer.value("ok", false) && answer["data"].value("stored", false);
  }
  static std::string HintsOf(const Json& answer) { return answer.value("hints", Json()).dump(); }

  std::string GapInEffect() const {
    const Json answer =
        ControlClient(bench_.SocketFile()).Ask(R"({"op":"read","uri":"0?SP_Gap?unsignedInt"})");
    std::string digits;
    (void)ParseHexBytes(answer["data"].value("value", ""), &digits);
    return digits;
  }
  std::optional<int> GapInStore() const {
    std::string error;
    const auto file = SqliteFile::Open(bench_.StoreFile(), &error);
    EXPECT_NE(file, nullptr) << error;
    const auto value = file == nullptr ? std::nullopt : file->Find({"com1", "gap"});
    return value ? std::optional<int>(std::get<int>(*value)) : std::nullopt;
  }

  // A store with the gap 111 that no process has open.
  void MakeStore() {
    const auto run = bench_.BeginReady(line_.Path(), "");
    ASSERT_TRUE(IsStored(SetGap(111)));
    run->Signal(SIGTERM);
    ASSERT_EQ(run->Status(), 128 + SIGTERM) << run->Errors();
  }

  // "loka run" refuses to start, says why and what goes on without the store.
  void ExpectRefused(const std::string& why, const std::string& wrapper = "") const {
    const auto run = bench_.Begin(line_.Path(), "", {}, wrapper);
    EXPECT_EQ(run->Status(), 1);
    EXPECT_NE(run->Errors().find(why), std::string::npos) << run->Errors();
    EXPECT_NE(run->Errors().find("--no-store goes on without stored settings"), std::string::npos)
        << run->Errors();
  }

  static std::string Contents(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
  }

  RunBench bench_;
  PseudoTerminal line_;
};

TEST_F(StoreFaults, AFullDiskIsToldAndLeavesWhatWasStored) {
  const SmallFileSystem disk(bench_.File("state"));
  if (!disk.WhyNot().empty()) {
    GTEST_SKIP() << disk.WhyNot();
  }
  const auto run = bench_.BeginReady(line_.Path(), "");
  ASSERT_TRUE(IsStored(SetGap(111)));
  disk.Fill();
  // The log of the store may have a little room left of its own.
  Json answer;
  int gapMs = 111;
  do {
    answer = SetGap(++gapMs);
  } while (IsStored(answer) && gapMs < 400);
  EXPECT_TRUE(answer.value("ok", false));
  EXPECT_FALSE(IsStored(answer));
  EXPECT_NE(HintsOf(answer).find("cannot grow: the disk is full; " + std::string(kHeldInMemory)),
            std::string::npos)
      << answer.dump();
  EXPECT_TRUE(run->AwaitErrors("the disk is full")) << run->Errors();
  // It is in effect all the same, and the next one is stored once there is room.
  EXPECT_EQ(GapInEffect(), std::to_string(gapMs));
  EXPECT_EQ(GapInStore(), gapMs - 1);
  disk.Empty();
  EXPECT_TRUE(IsStored(SetGap(999)));
  run->Signal(SIGKILL);
  EXPECT_EQ(run->Status(), 128 + SIGKILL);
  EXPECT_EQ(GapInStore(), 999);
}

// The limit of a file's size, where no right is needed to set one.
TEST_F(StoreFaults, AFileThatMayNotGrowIsToldAndLeavesWhatWasStored) {
  const auto run = bench_.BeginReady(line_.Path(), "", {}, "prlimit --fsize=60000");
  int gapMs = 100;
  Json answer = SetGap(gapMs);
  ASSERT_TRUE(IsStored(answer)) << answer.dump();
  while (IsStored(answer) && gapMs < 400) {
    answer = SetGap(++gapMs);
  }
  ASSERT_TRUE(answer.is_object()) << run->Errors();
  EXPECT_TRUE(answer.value("ok", false)) << answer.dump();
  EXPECT_NE(HintsOf(answer).find("disk I/O error; " + std::string(kHeldInMemory)),
            std::string::npos)
      << answer.dump();
  EXPECT_EQ(GapInEffect(), std::to_string(gapMs));
  run->Signal(SIGTERM);
  EXPECT_EQ(run->Status(), 128 + SIGTERM) << run->Errors();
  EXPECT_EQ(GapInStore(), gapMs - 1);
}

TEST_F(StoreFaults, AStoreOnAFullDiskIsStillRead) {
  const SmallFileSystem disk(bench_.File("state"));
  if (!disk.WhyNot().empty()) {
    GTEST_SKIP() << disk.WhyNot();
  }
  MakeStore();
  disk.Fill();
  const auto run = bench_.BeginReady(line_.Path(), "gap=7");
  EXPECT_EQ(GapInEffect(), "111");
  EXPECT_FALSE(IsStored(SetGap(222)));
  EXPECT_EQ(GapInEffect(), "222");
}

TEST_F(StoreFaults, AStoreWithoutTheRightToWriteIsToldAtTheStart) {
  MakeStore();
  if (!OtherUser::CanRunLoka()) {
    GTEST_SKIP() << "only root can run this build, and no file is closed to root";
  }
  bench_.GiveTo(OtherUser::Id());
  ASSERT_EQ(chown(line_.Path().c_str(), OtherUser::Id(), OtherUser::Id()), 0);
  ASSERT_EQ(chmod(bench_.StoreFile().c_str(), 0400), 0);
  ExpectRefused("cannot open the store " + bench_.StoreFile() + ": Permission denied",
                OtherUser::Wrapper());
}

TEST_F(StoreFaults, AReadOnlyFileSystemIsToldAtTheStart) {
  const SmallFileSystem disk(bench_.File("state"));
  if (!disk.WhyNot().empty()) {
    GTEST_SKIP() << disk.WhyNot();
  }
  MakeStore();
  ASSERT_TRUE(disk.MakeReadOnly());
  ExpectRefused("cannot open the store " + bench_.StoreFile() + ": Read-only file system");
  const auto run = bench_.BeginReady(line_.Path(), "gap=7", {"--no-store"});
  EXPECT_EQ(GapInEffect(), "7");
}

struct Damage {
  const char* name;
  std::size_t at;  // of the file's first page, or counted from its end when `fromEnd`
  bool fromEnd;
  const char* says;
};

class DamagedStore : public StoreFaults, public testing::WithParamInterface<Damage> {};

TEST_P(DamagedStore, IsLeftAsItIsAndTold) {
  MakeStore();
  std::string contents = Contents(bench_.StoreFile());
  ASSERT_GT(contents.size(), 1000U);
  const Damage& damage = GetParam();
  const std::size_t at = damage.fromEnd ? contents.size() - damage.at : damage.at;
  for (std::size_t i = at; i < std::min(at + 200, contents.size()); ++i) {
    contents[i] = static_cast<char>(contents[i] ^ 0x5A);
  }
  std::ofstream(bench_.StoreFile(), std::ios::binary) << contents;
  ExpectRefused(damage.says);
  EXPECT_EQ(Contents(bench_.StoreFile()), contents);
  const auto run = bench_.BeginReady(line_.Path(), "gap=7", {"--no-store"});
  EXPECT_EQ(GapInEffect(), "7");
}

INSTANTIATE_TEST_SUITE_P(Places, DamagedStore,
                         testing::Values(Damage{"Header", 0, false, "is damaged or not a store"},
                                         Damage{"Catalogue", 100, false, "is damaged"},
                                         Damage{"LastPage", 200, true, "is damaged"}),
                         [](const auto& damage) { return std::string(damage.param.name); });

TEST_F(StoreFaults, AStoreThatIsCutOffIsTold) {
  MakeStore();
  ASSERT_EQ(truncate(bench_.StoreFile().c_str(), 5000), 0);
  ExpectRefused("is damaged");
}

// A connection of another process: this one.
class OtherConnection {
 public:
  explicit OtherConnection(const std::string& path) {
    EXPECT_EQ(sqlite3_open(path.c_str(), &database_), SQLITE_OK);
  }
  ~OtherConnection() { sqlite3_close(database_); }
  OtherConnection(const OtherConnection&) = delete;
  OtherConnection& operator=(const OtherConnection&) = delete;
  void Execute(const char* sql) const {
    EXPECT_EQ(sqlite3_exec(database_, sql, nullptr, nullptr, nullptr), SQLITE_OK) << sql;
  }

 private:
  sqlite3* database_ = nullptr;
};

// Both wait two seconds for the other process, which nobody asserts.
TEST_F(StoreFaults, ALockOfAnotherProcessIsToldAtTheStart) {
  MakeStore();
  const OtherConnection other(bench_.StoreFile());
  other.Execute("PRAGMA locking_mode = EXCLUSIVE");
  other.Execute("BEGIN EXCLUSIVE");
  ExpectRefused("the store " + bench_.StoreFile() + " is locked by another process");
}

TEST_F(StoreFaults, ALockOfAnotherProcessKeepsTheValueInEffectAndIsTold) {
  const auto run = bench_.BeginReady(line_.Path(), "");
  ASSERT_TRUE(IsStored(SetGap(111)));
  const OtherConnection other(bench_.StoreFile());
  other.Execute("BEGIN IMMEDIATE");
  const Json answer = SetGap(222);
  EXPECT_TRUE(answer.value("ok", false)) << answer.dump();
  EXPECT_FALSE(IsStored(answer));
  EXPECT_NE(HintsOf(answer).find("is locked by another process; " + std::string(kHeldInMemory)),
            std::string::npos)
      << answer.dump();
  EXPECT_EQ(GapInEffect(), "222");
  other.Execute("ROLLBACK");
  EXPECT_EQ(GapInStore(), 111);
  EXPECT_TRUE(IsStored(SetGap(333)));
  EXPECT_EQ(GapInStore(), 333);
}

// Somebody tidies up below a running instance: nothing may be called stored that a restart does not
// find.
TEST_F(StoreFaults, AStoreThatWasRemovedMeanwhileIsNoStore) {
  const auto run = bench_.BeginReady(line_.Path(), "");
  ASSERT_TRUE(IsStored(SetGap(111)));
  ASSERT_EQ(rename(bench_.StoreFile().c_str(), bench_.File("moved.db").c_str()), 0);
  const Json answer = SetGap(222);
  EXPECT_TRUE(answer.value("ok", false)) << answer.dump();
  EXPECT_FALSE(IsStored(answer));
  EXPECT_NE(HintsOf(answer).find("was moved or removed"), std::string::npos) << answer.dump();
  EXPECT_EQ(GapInEffect(), "222");
}

}  // namespace
