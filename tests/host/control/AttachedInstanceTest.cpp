// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <atomic>
#include <thread>

#include "host/control/AttachedInstance.h"
#include "host/control/ControlServer.h"
#include "host/events/EventSink.h"
#include "tests/host/control/ControlFolder.h"
#include "tests/host/support/TestLimit.h"

namespace {

using Json = nlohmann::json;

class NoteLog final : public EventSink {
 public:
  void OnEvent(const HostEvent& event) override {
    if (const auto* const note = std::get_if<NoteMade>(&event.detail)) {
      texts.push_back(note->text);
    }
  }
  std::vector<std::string> texts;
};

HostEvent NoteOfInstance(const std::string& text) { return {0, "com3", NoteMade{text}}; }

class AttachedInstanceTest : public testing::Test {
 protected:
  void Listen() {
    std::string error;
    server_ = ControlServer::Listen(
        "com3", [this](const Json& request) { return Handle(request); }, &error);
    ASSERT_NE(server_, nullptr) << error;
  }
  Answer Handle(const Json& request) {
    if (request["op"] == "refuse") {
      Answer answer = Refusal("no", ExitStatus::kPort);
      answer.errorCode = -3;
      answer.hints = {"hint"};
      return answer;
    }
    if (request["op"] == "something") {
      // An event in front of the answer: the client keeps it.
      server_->OnEvent(NoteOfInstance("during something"));
    }
    Answer answer;
    answer.data = info_;
    return answer;
  }
  std::unique_ptr<AttachedInstance> Attach() { return AttachedInstance::Connect("com3", &error_); }

  const ControlFolderForTest folder_;
  Json info_ = {{"port", "com3"}, {"path", "/dev/x"}};
  std::string error_;
  std::unique_ptr<ControlServer> server_;
};

TEST_F(AttachedInstanceTest, SaysWhenNobodyListens) {
  EXPECT_EQ(Attach(), nullptr);
  EXPECT_NE(error_.find("com3.sock"), std::string::npos) << error_;
}

TEST_F(AttachedInstanceTest, KnowsTheInstance) {
  Listen();
  const auto instance = Attach();
  ASSERT_NE(instance, nullptr) << error_;
  EXPECT_EQ(instance->Port(), "com3");
  EXPECT_EQ(instance->Info(), info_);
}

TEST_F(AttachedInstanceTest, RefusesWhatIsNoInstance) {
  Listen();
  for (const Json& wrong : {Json::object(), Json({{"port", 3}})}) {
    info_ = wrong;
    EXPECT_EQ(Attach(), nullptr);
    EXPECT_EQ(error_, "no instance answers there");
  }
}

TEST_F(AttachedInstanceTest, BringsBackTheWholeAnswer) {
  Listen();
  const auto instance = Attach();
  ASSERT_NE(instance, nullptr) << error_;
  const Answer answer = instance->Call({{"op", "refuse"}});
  EXPECT_EQ(answer.status, ExitStatus::kPort);
  EXPECT_EQ(answer.text, "no");
  EXPECT_EQ(answer.errorCode, -3);
  EXPECT_EQ(answer.hints, std::vector<std::string>{"hint"});
}

TEST_F(AttachedInstanceTest, ServesEventsAlsoThoseThatCameBetween) {
  Listen();
  const auto instance = Attach();
  ASSERT_NE(instance, nullptr) << error_;
  ASSERT_TRUE(instance->Subscribe().IsDone());
  EXPECT_TRUE(instance->Call({{"op", "something"}}).IsDone());
  server_->OnEvent(NoteOfInstance("later"));
  NoteLog log;
  const Answer served = instance->Serve(
      &log, [&] { return log.texts.size() >= 2; }, Deadline::After(kLimitMs));
  EXPECT_TRUE(served.IsDone()) << served.text;
  EXPECT_EQ(log.texts, (std::vector<std::string>{"during something", "later"}));
  const Answer tooLate = instance->Serve(
      &log, [] { return false; }, Deadline::After(0));
  EXPECT_EQ(tooLate.status, ExitStatus::kTimeout);
}

TEST_F(AttachedInstanceTest, AWakeUpMakesServeAskWhetherItIsDone) {
  Listen();
  const auto instance = Attach();
  ASSERT_NE(instance, nullptr) << error_;
  std::atomic<bool> isDone{false};
  NoteLog log;
  std::thread other([&] {
    isDone.store(true);
    instance->Wake();
  });
  const Answer served = instance->Serve(
      &log, [&] { return isDone.load(); }, Deadline::After(kLimitMs));
  EXPECT_TRUE(served.IsDone()) << served.text;
  other.join();
}

TEST_F(AttachedInstanceTest, NoticesTheEndOfTheInstance) {
  Listen();
  const auto instance = Attach();
  ASSERT_NE(instance, nullptr) << error_;
  ASSERT_TRUE(instance->Subscribe().IsDone());
  server_.reset();
  NoteLog log;
  const Answer served = instance->Serve(
      &log, [] { return false; }, Deadline::After(kLimitMs));
  EXPECT_EQ(served.status, ExitStatus::kPortLost);
  EXPECT_EQ(instance->Call({{"op", "refuse"}}).status, ExitStatus::kPortLost);
}

}  // namespace
