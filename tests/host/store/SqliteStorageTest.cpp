// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <sqlite3.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <fstream>
#include <iterator>
#include <random>
#include <thread>

#include "host/store/SqliteStorage.h"
#include "host/store/StorageBatch.h"
#include "tests/host/support/FileMode.h"
#include "tests/host/support/TemporaryFolder.h"

namespace {

constexpr const char* kTwelveKeys[] = {"baud",      "parity",    "bits",      "stop",
                                       "mode",      "rx_prefix", "rx_suffix", "tx_prefix",
                                       "tx_suffix", "gap",       "hex",       "queue"};

std::string Contents(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

class SqliteStorageTest : public testing::Test {
 protected:
  std::unique_ptr<SqliteStorage> Open() {
    std::string error;
    auto storage = SqliteStorage::Open(
        path_, [this](const std::string& text) { failures_.push_back(text); }, &error);
    EXPECT_NE(storage, nullptr) << error;
    return storage;
  }
  std::string OpenError(const std::string& path) {
    std::string error;
    EXPECT_EQ(SqliteStorage::Open(path, nullptr, &error), nullptr);
    return error;
  }

  TemporaryFolder folder_;
  const std::string path_ = folder_.File("store.db");
  std::vector<std::string> failures_;
};

TEST_F(SqliteStorageTest, KeepsTypedValuesByIdentAndKey) {
  const auto storage = Open();
  EXPECT_EQ(storage->Exists("a", "baud"), 0);
  EXPECT_EQ(storage->GetInteger("a", "baud"), 0);
  EXPECT_FALSE(storage->GetBoolean("a", "baud"));
  EXPECT_STREQ(storage->GetString("a", "baud"), "");
  storage->SetInteger("a", "baud", -2147483647 - 1);
  storage->SetBoolean("a", "hex", true);
  storage->SetString("a", "prefix", "02\xFF\"';--");
  storage->SetInteger("b", "baud", 300);
  EXPECT_NE(storage->Exists("a", "baud"), 0);
  EXPECT_EQ(storage->GetInteger("a", "baud"), -2147483647 - 1);
  EXPECT_TRUE(storage->GetBoolean("a", "hex"));
  EXPECT_STREQ(storage->GetString("a", "prefix"), "02\xFF\"';--");
  EXPECT_EQ(storage->GetInteger("b", "baud"), 300);
  EXPECT_EQ(storage->Exists("A", "baud"), 0);
  EXPECT_EQ(storage->All("a").size(), 3U);
}

TEST_F(SqliteStorageTest, SurvivesClosing) {
  {
    const auto storage = Open();
    storage->SetInteger("a", "baud", 9600);
    storage->SetBoolean("a", "hex", false);
    storage->SetString("a", "prefix", "02");
    storage->SetString("a", "empty", "");
  }
  const auto storage = Open();
  EXPECT_EQ(storage->GetInteger("a", "baud"), 9600);
  EXPECT_NE(storage->Exists("a", "hex"), 0);
  EXPECT_STREQ(storage->GetString("a", "prefix"), "02");
  EXPECT_NE(storage->Exists("a", "empty"), 0);
  EXPECT_STREQ(storage->GetString("a", "empty"), "");
}

TEST_F(SqliteStorageTest, LaterValueReplacesAnEarlierOneOfAnyType) {
  const auto storage = Open();
  storage->SetInteger("a", "k", 5);
  storage->SetString("a", "k", "text");
  EXPECT_STREQ(storage->GetString("a", "k"), "text");
  EXPECT_EQ(storage->GetInteger("a", "k"), 0);
  EXPECT_FALSE(storage->GetBoolean("a", "k"));
  EXPECT_EQ(storage->All("a").size(), 1U);
}

TEST_F(SqliteStorageTest, NullTextsCountAsEmpty) {
  const auto storage = Open();
  storage->SetString(nullptr, nullptr, nullptr);
  EXPECT_NE(storage->Exists("", ""), 0);
  EXPECT_STREQ(storage->GetString(nullptr, nullptr), "");
}

TEST_F(SqliteStorageTest, CopiesIntoABufferOnlyWhatFits) {
  const auto storage = Open();
  storage->SetString("a", "k", "12345");
  storage->SetInteger("a", "n", 5);
  char buffer[8];
  std::fill(std::begin(buffer), std::end(buffer), '#');
  EXPECT_EQ(storage->GetStringInto("a", "k", buffer, 5), 0);
  EXPECT_EQ(storage->GetStringInto("a", "k", buffer, 0), 0);
  EXPECT_EQ(storage->GetStringInto("a", "k", buffer, -1), 0);
  EXPECT_EQ(storage->GetStringInto("a", "k", nullptr, 8), 0);
  EXPECT_EQ(storage->GetStringInto("a", "none", buffer, 8), 0);
  EXPECT_EQ(storage->GetStringInto("a", "n", buffer, 8), 0);
  EXPECT_EQ(std::string(buffer, 8), "########");
  EXPECT_EQ(storage->GetStringInto("a", "k", buffer, 6), 1);
  EXPECT_EQ(std::string(buffer, 8), std::string("12345\0##", 8));
}

TEST_F(SqliteStorageTest, TextStaysValidForItsThread) {
  const auto storage = Open();
  storage->SetString("a", "k", "first");
  storage->SetString("a", "l", "other");
  const char* const text = storage->GetString("a", "k");
  std::thread([&] { EXPECT_STREQ(storage->GetString("a", "l"), "other"); }).join();
  storage->SetString("a", "k", "second");
  EXPECT_STREQ(text, "first");
}

TEST_F(SqliteStorageTest, AnswersForTheExtendedInterface) {
  const auto storage = Open();
  EXPECT_EQ(storage->ConvertTo("IPermanentStorage"), storage.get());
  EXPECT_EQ(storage->ConvertTo("IPermanentStorage2"), storage.get());
  EXPECT_EQ(storage->ConvertTo("IPermanentStorage3"), nullptr);
}

TEST_F(SqliteStorageTest, BatchIsVisibleAtOnceAndStoredAtItsEnd) {
  const auto storage = Open();
  const auto reader = Open();
  storage->SetInteger("a", "k", 1);
  storage->BeginBatch();
  storage->SetInteger("a", "k", 2);
  storage->SetString("a", "l", "x");
  EXPECT_EQ(storage->GetInteger("a", "k"), 2);
  std::thread([&] { EXPECT_EQ(storage->GetInteger("a", "k"), 2); }).join();
  EXPECT_EQ(storage->All("a").size(), 2U);
  // Another process sees nothing of it yet.
  EXPECT_EQ(reader->GetInteger("a", "k"), 1);
  EXPECT_EQ(reader->Exists("a", "l"), 0);
  std::string error;
  EXPECT_TRUE(storage->EndBatch(&error)) << error;
  EXPECT_EQ(reader->GetInteger("a", "k"), 2);
  EXPECT_STREQ(reader->GetString("a", "l"), "x");
  EXPECT_EQ(storage->GetInteger("a", "k"), 2);
}

TEST_F(SqliteStorageTest, BatchBelongsToItsThread) {
  const auto storage = Open();
  const auto reader = Open();
  const StorageBatch batch(storage.get());
  storage->SetInteger("a", "mine", 1);
  std::thread([&] { storage->SetInteger("a", "other", 2); }).join();
  EXPECT_EQ(reader->GetInteger("a", "other"), 2);
  EXPECT_EQ(reader->Exists("a", "mine"), 0);
}

TEST_F(SqliteStorageTest, BatchesNest) {
  const auto storage = Open();
  const auto reader = Open();
  std::string error;
  {
    StorageBatch outer(storage.get());
    {
      const StorageBatch inner(storage.get());
      storage->SetInteger("a", "k", 1);
    }
    EXPECT_EQ(reader->Exists("a", "k"), 0);
    EXPECT_TRUE(outer.End(&error));
    EXPECT_EQ(reader->GetInteger("a", "k"), 1);
  }
  EXPECT_TRUE(storage->EndBatch(&error));
  StorageBatch none(nullptr);
  EXPECT_TRUE(none.End(&error));
}

TEST_F(SqliteStorageTest, MakesFileAndFoldersForThisUserAlone) {
  const std::string path = folder_.File("new/deep/store.db");
  std::string error;
  const auto storage = SqliteStorage::Open(path, nullptr, &error);
  ASSERT_NE(storage, nullptr) << error;
  storage->SetInteger("a", "k", 1);
  EXPECT_EQ(ModeOf(path), 0600U);
  EXPECT_EQ(ModeOf(path + "-wal"), 0600U);
  EXPECT_EQ(ModeOf(folder_.File("new/deep")), 0700U);
  EXPECT_EQ(ModeOf(folder_.File("new")), 0700U);
}

TEST_F(SqliteStorageTest, LeavesAFileThatIsNoDatabaseAlone) {
  std::ofstream(path_) << std::string(5000, 'x');
  const std::string before = Contents(path_);
  const std::string error = OpenError(path_);
  EXPECT_NE(error.find("is damaged or not a store"), std::string::npos) << error;
  EXPECT_NE(error.find(path_), std::string::npos) << error;
  EXPECT_EQ(Contents(path_), before);
}

TEST_F(SqliteStorageTest, LeavesADamagedStoreAlone) {
  {
    const auto storage = Open();
    const StorageBatch batch(storage.get());
    for (int i = 0; i < 1000; ++i) {
      storage->SetString("ident", ("key" + std::to_string(i)).c_str(), "some value of a length");
    }
  }
  std::string bytes = Contents(path_);
  ASSERT_GT(bytes.size(), 3 * 4096U);
  // Behind the first page, so that it still looks like a database.
  for (std::size_t at = 4096; at < bytes.size(); ++at) {
    bytes[at] = static_cast<char>(bytes[at] ^ 0x5A);
  }
  std::ofstream(path_, std::ios::binary) << bytes;
  const std::string error = OpenError(path_);
  EXPECT_NE(error.find("damaged"), std::string::npos) << error;
  EXPECT_EQ(Contents(path_), bytes);
}

TEST_F(SqliteStorageTest, LeavesADatabaseOfAnotherProgramAlone) {
  sqlite3* database = nullptr;
  ASSERT_EQ(sqlite3_open(path_.c_str(), &database), SQLITE_OK);
  ASSERT_EQ(sqlite3_exec(database, "CREATE TABLE t (a)", nullptr, nullptr, nullptr), SQLITE_OK);
  sqlite3_close(database);
  const std::string before = Contents(path_);
  const std::string error = OpenError(path_);
  EXPECT_NE(error.find("is a database of another program"), std::string::npos) << error;
  EXPECT_EQ(Contents(path_), before);
}

TEST_F(SqliteStorageTest, SaysWhenTheFolderCannotBeMade) {
  std::ofstream(folder_.File("file")) << "x";
  const std::string error = OpenError(folder_.File("file/sub/store.db"));
  EXPECT_EQ(error.rfind("cannot make the folder ", 0), 0U) << error;
}

TEST_F(SqliteStorageTest, FailedBatchKeepsItsValuesInMemoryAndSaysSo) {
  const auto storage = Open();
  storage->SetInteger("a", "k", 1);
  // Files of this process may not grow past what they are now: the disk is full.
  rlimit former{};
  ASSERT_EQ(getrlimit(RLIMIT_FSIZE, &former), 0);
  const auto formerHandler = signal(SIGXFSZ, SIG_IGN);
  rlimit none = former;
  none.rlim_cur = 0;
  ASSERT_EQ(setrlimit(RLIMIT_FSIZE, &none), 0);
  storage->BeginBatch();
  for (const char* const key : kTwelveKeys) {
    storage->SetString("a", key, std::string(100, 'v').c_str());
  }
  std::string error;
  const bool isStored = storage->EndBatch(&error);
  ASSERT_EQ(setrlimit(RLIMIT_FSIZE, &former), 0);
  signal(SIGXFSZ, formerHandler);

  EXPECT_FALSE(isStored);
  EXPECT_NE(error.find(path_), std::string::npos) << error;
  EXPECT_NE(error.find("; the values hold until the program ends"), std::string::npos) << error;
  EXPECT_EQ(failures_, std::vector<std::string>{error});
  EXPECT_STREQ(storage->GetString("a", "gap"), std::string(100, 'v').c_str());
  EXPECT_EQ(Open()->Exists("a", "gap"), 0);
  // Later values are stored again.
  storage->SetInteger("a", "k", 2);
  EXPECT_EQ(Open()->GetInteger("a", "k"), 2);
  EXPECT_EQ(failures_.size(), 1U);
}

TEST_F(SqliteStorageTest, ThreadsSetTheSameKeysWithoutLosingTheLast) {
  constexpr int kRounds = 40;
  const auto storage = Open();
  const auto setMany = [&](int base) {
    for (int i = 0; i < kRounds; ++i) {
      const StorageBatch batch(storage.get());
      for (const char* const key : kTwelveKeys) {
        storage->SetInteger("a", key, base + i);
      }
    }
  };
  std::thread first(setMany, 0);
  std::thread second(setMany, 1000);
  first.join();
  second.join();
  std::map<std::string, int> visible;
  for (const char* const key : kTwelveKeys) {
    visible[key] = storage->GetInteger("a", key);
  }
  const auto reader = Open();
  for (const char* const key : kTwelveKeys) {
    EXPECT_EQ(reader->GetInteger("a", key), visible[key]) << key;
    EXPECT_TRUE(visible[key] == kRounds - 1 || visible[key] == 1000 + kRounds - 1) << visible[key];
  }
  EXPECT_TRUE(failures_.empty());
}

// Stores batch after batch and writes a sign after each until it is killed.
[[noreturn]] void StoreUntilKilled(const std::string& path, int signs) {
  std::string error;
  const auto storage = SqliteStorage::Open(path, nullptr, &error);
  if (storage == nullptr) {
    _exit(1);
  }
  for (int round = storage->GetInteger("a", kTwelveKeys[0]) + 1;; ++round) {
    StorageBatch batch(storage.get());
    for (const char* const key : kTwelveKeys) {
      storage->SetInteger("a", key, round);
    }
    const char sign = batch.End(&error) ? 'y' : 'n';
    if (write(signs, &sign, 1) != 1) {
      _exit(2);
    }
  }
}

TEST_F(SqliteStorageTest, KillAtAnyMomentLeavesWholeBatches) {
  constexpr int kKills = 25;
  std::mt19937 random(20261121);
  std::uniform_int_distribution<int> signsBeforeKill(0, 6);
  std::uniform_int_distribution<unsigned int> spin(0, 400000);
  int stored = 0;
  for (int kill_ = 0; kill_ < kKills; ++kill_) {
    int signs[2];
    ASSERT_EQ(pipe(signs), 0);
    const pid_t child = fork();
    if (child == 0) {
      close(signs[0]);
      StoreUntilKilled(path_, signs[1]);
    }
    close(signs[1]);
    int told = 0;
    char sign = 0;
    for (int wanted = signsBeforeKill(random); told < wanted && read(signs[0], &sign, 1) == 1;) {
      ASSERT_EQ(sign, 'y');
      ++told;
    }
    // Some moment within the next batch.
    for (volatile unsigned int left = spin(random); left > 0;) {
      left = left - 1;
    }
    kill(child, SIGKILL);
    while (read(signs[0], &sign, 1) == 1) {
      ++told;
    }
    close(signs[0]);
    int status = 0;
    waitpid(child, &status, 0);
    ASSERT_TRUE(WIFSIGNALED(status)) << WEXITSTATUS(status);

    const auto storage = Open();
    ASSERT_NE(storage, nullptr);
    const int round = storage->GetInteger("a", kTwelveKeys[0]);
    for (const char* const key : kTwelveKeys) {
      ASSERT_EQ(storage->GetInteger("a", key), round) << key;
    }
    // What was reported stored is there; the batch that was being stored may be.
    ASSERT_GE(round, stored + told);
    ASSERT_LE(round, stored + told + 1);
    stored = round;
  }
  EXPECT_GT(stored, 0);
}

}  // namespace
