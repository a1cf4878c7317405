// SPDX-License-Identifier: Apache-2.0
// The port of a running instance goes away, comes back, is another device, is taken by somebody
// else or closed to this user.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>

#include "host/port/PseudoTerminal.h"
#include "tests/host/faults/OtherUser.h"
#include "tests/host/faults/RunBench.h"
#include "tests/host/port/LockingProcess.h"

namespace {

namespace fs = std::filesystem;

class PortFaults : public testing::Test {
 protected:
  std::string Link() const { return bench_.File("port"); }

  // From now on the link leads to this device.
  void PlugIn(const PseudoTerminal& device) const {
    fs::create_symlink(device.Path(), Link() + ".new");
    fs::rename(Link() + ".new", Link());
  }
  void PullOut(std::unique_ptr<PseudoTerminal>* device) const {
    fs::remove(Link());
    device->reset();
  }
  void ExpectToken(const PseudoTerminal& device, const std::string& token,
                   const ProgramRun& run) const {
    ASSERT_TRUE(device.Send(token + "\n", Deadline::After(ProgramRun::kLimitMs)));
    EXPECT_TRUE(run.AwaitErrors("\"" + token + "\"")) << run.Errors();
  }

  RunBench bench_;
};

TEST_F(PortFaults, GoneBackAndReplacedByAnotherDevice) {
  auto device = std::make_unique<PseudoTerminal>();
  PlugIn(*device);
  const auto run = bench_.BeginReady(Link(), "rx_suffix=0A", {"-v"});
  ExpectToken(*device, "first", *run);
  PullOut(&device);
  EXPECT_TRUE(run->AwaitErrors("line lost")) << run->Errors();
  // Everything but the line goes on: settings are stored, sends are refused and counted.
  ControlClient client(bench_.SocketFile());
  EXPECT_TRUE(client.Ask(R"({"op":"stage","key":"gap","value":"77"})").value("ok", false));
  const auto done = client.Ask(R"({"op":"done"})");
  EXPECT_TRUE(done["data"].value("stored", false)) << done.dump();
  const auto sent = client.Ask(R"({"op":"send","hex":"41"})");
  EXPECT_FALSE(sent.value("ok", true));
  EXPECT_NE(sent.value("text", "").find("the line did not take the token"), std::string::npos);
  // Another device under the same name is what people mean by it.
  const PseudoTerminal other;
  PlugIn(other);
  EXPECT_TRUE(run->AwaitErrors("line is back")) << run->Errors();
  ExpectToken(other, "second", *run);
  EXPECT_TRUE(client.Ask(R"({"op":"send","hex":"42"})").value("ok", false));
  std::string seen;
  EXPECT_TRUE(other.Receive(1, Deadline::After(ProgramRun::kLimitMs), &seen));
  EXPECT_EQ(seen, "B");
  EXPECT_EQ(bench_.Count("losses"), 1U);
  EXPECT_EQ(bench_.Count("reconnects"), 1U);
  EXPECT_EQ(bench_.Count("tokens"), 2U);
}

TEST_F(PortFaults, TakenBySomebodyElseWhenItComesBack) {
  const PseudoTerminal other;
  auto holder = std::make_unique<LockingProcess>(other.Path());
  // Behind the fork, which would keep it open.
  auto device = std::make_unique<PseudoTerminal>();
  PlugIn(*device);
  const auto run = bench_.BeginReady(Link(), "rx_suffix=0A", {"-v"});
  PullOut(&device);
  ASSERT_TRUE(run->AwaitErrors("line lost")) << run->Errors();
  PlugIn(other);
  EXPECT_TRUE(run->AwaitErrors("in use")) << run->Errors();
  holder.reset();
  EXPECT_TRUE(run->AwaitErrors("line is back")) << run->Errors();
  ExpectToken(other, "mine", *run);
}

TEST_F(PortFaults, TakenBySomebodyElseAtTheStart) {
  const PseudoTerminal device;
  const LockingProcess holder(device.Path());
  const auto run = bench_.Begin(device.Path(), "rx_suffix=0A");
  EXPECT_EQ(run->Status(), 5);
  EXPECT_NE(run->Errors().find("held by process " + std::to_string(holder.ProcessId())),
            std::string::npos)
      << run->Errors();
}

TEST_F(PortFaults, WithoutRightsAtTheStart) {
  if (!OtherUser::CanRunLoka()) {
    GTEST_SKIP() << "only root can run this build, and no port is closed to root";
  }
  const PseudoTerminal device;
  ASSERT_EQ(chmod(device.Path().c_str(), OtherUser::IsAnother() ? 0600 : 0000), 0);
  const auto run =
      bench_.Begin(device.Path(), "rx_suffix=0A", {"--no-store"}, OtherUser::Wrapper());
  EXPECT_EQ(run->Status(), 5);
  EXPECT_NE(run->Errors().find("you are not allowed to open it"), std::string::npos)
      << run->Errors();
  EXPECT_NE(run->Errors().find("sudo usermod -aG"), std::string::npos) << run->Errors();
}

TEST_F(PortFaults, WithoutRightsWhenItComesBack) {
  if (!OtherUser::CanRunLoka()) {
    GTEST_SKIP() << "only root can run this build, and no port is closed to root";
  }
  auto device = std::make_unique<PseudoTerminal>();
  const PseudoTerminal other;
  for (const std::string& path : {device->Path(), other.Path()}) {
    ASSERT_EQ(chown(path.c_str(), OtherUser::Id(), OtherUser::Id()), 0);
  }
  ASSERT_EQ(chmod(other.Path().c_str(), 0000), 0);
  PlugIn(*device);
  bench_.GiveTo(OtherUser::Id());
  const auto run = bench_.BeginReady(Link(), "rx_suffix=0A", {"-v"}, OtherUser::Wrapper());
  PullOut(&device);
  ASSERT_TRUE(run->AwaitErrors("line lost")) << run->Errors();
  PlugIn(other);
  EXPECT_TRUE(run->AwaitErrors("you are not allowed to open it")) << run->Errors();
  ASSERT_EQ(chmod(other.Path().c_str(), 0600), 0);
  EXPECT_TRUE(run->AwaitErrors("line is back")) << run->Errors();
  ExpectToken(other, "again", *run);
}

}  // namespace
