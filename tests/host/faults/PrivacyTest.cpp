// SPDX-License-Identifier: Apache-2.0
// What an instance makes is there for its own user alone, whatever the umask says, and nothing of
// it needs root.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>

#include "host/port/PseudoTerminal.h"
#include "tests/host/faults/OtherUser.h"
#include "tests/host/faults/RunBench.h"

namespace {

namespace fs = std::filesystem;

TEST(Privacy, EverythingThatAnInstanceMakesIsForItsUserAlone) {
  const RunBench bench;
  const PseudoTerminal line;
  const auto run = bench.BeginReady(line.Path(), "", {}, "sh -c 'umask 000; exec \"$0\" \"$@\"'");
  ControlClient client(bench.SocketFile());
  (void)client.Ask(R"({"op":"stage","key":"gap","value":"77"})");
  ASSERT_TRUE(client.Ask(R"({"op":"done"})")["data"].value("stored", false));
  std::size_t count = 0;
  for (const char* const folder : {"state", "control"}) {
    EXPECT_EQ(fs::status(bench.File(folder)).permissions(), fs::perms::owner_all) << folder;
    for (const auto& entry : fs::recursive_directory_iterator(bench.File(folder))) {
      const fs::perms others = fs::perms::group_all | fs::perms::others_all;
      EXPECT_EQ(entry.status().permissions() & others, fs::perms::none) << entry.path();
      ++count;
    }
  }
  // The store with its two logs in a folder, the socket and its lock.
  EXPECT_EQ(count, 6U);
}

TEST(Privacy, AnotherUserCannotAttach) {
  if (!OtherUser::IsAnother() || !OtherUser::CanRunLoka()) {
    GTEST_SKIP() << "only root can become another user";
  }
  const RunBench bench;
  const PseudoTerminal line;
  const auto run = bench.BeginReady(line.Path(), "");
  // Even when the way to the socket is open to everybody.
  ASSERT_EQ(chmod(fs::path(bench.File("x")).parent_path().c_str(), 0777), 0);
  ASSERT_EQ(chmod(bench.File("control").c_str(), 0777), 0);
  ASSERT_EQ(chmod(bench.SocketFile().c_str(), 0777), 0);
  const auto stats = bench.Command({"stats"}, OtherUser::Wrapper());
  EXPECT_EQ(stats->Status(), 5) << stats->Errors();
  const auto own = bench.Command({"stats"});
  EXPECT_EQ(own->Status(), 0) << own->Errors();
}

TEST(Privacy, NothingNeedsRoot) {
  if (!OtherUser::CanRunLoka()) {
    GTEST_SKIP() << "only root can run this build";
  }
  const RunBench bench;
  const PseudoTerminal line;
  ASSERT_EQ(chown(line.Path().c_str(), OtherUser::Id(), OtherUser::Id()), 0);
  bench.GiveTo(OtherUser::Id());
  const auto run = bench.BeginReady(line.Path(), "rx_suffix=0A", {"-v"}, OtherUser::Wrapper());
  ASSERT_TRUE(line.Send("A\n", Deadline::After(ProgramRun::kLimitMs)));
  EXPECT_TRUE(run->AwaitErrors("\"A\"")) << run->Errors();
  const auto set = bench.Command({"set", "gap=77"}, OtherUser::Wrapper());
  EXPECT_EQ(set->Line(), "staged: gap 77 (active 0)");
  EXPECT_EQ(set->Line(), "applied and stored");
  EXPECT_EQ(set->Status(), 0) << set->Errors();
}

}  // namespace
