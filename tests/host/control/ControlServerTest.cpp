// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <atomic>
#include <fstream>
#include <stdexcept>

#include "host/control/ControlServer.h"
#include "host/events/EventJson.h"
#include "tests/host/control/ControlClient.h"
#include "tests/host/control/ControlFolder.h"
#include "tests/host/support/FileMode.h"

namespace {

using Json = nlohmann::json;

HostEvent NoteOfServer(const std::string& text) { return {0, "com1", NoteMade{text}}; }

class ControlServerTest : public testing::Test {
 protected:
  std::unique_ptr<ControlServer> Listen(const std::string& name = "com1") {
    return ControlServer::Listen(
        name, [this](const Json& request) { return Handle(request); }, &error_);
  }
  Answer Handle(const Json& request) {
    ++requestCount_;
    if (request.contains("throw")) {
      throw std::runtime_error("thrown");
    }
    Answer answer;
    answer.data["echo"] = request.contains("text") ? request["text"] : Json("none");
    if (request.contains("bytes")) {
      answer.data["echo"] = std::string(request["bytes"].get<std::size_t>(), 'x');
    }
    return answer;
  }

  const ControlFolderForTest folder_;
  const std::string path_ = folder_.File("com1.sock");
  std::string error_;
  std::atomic<int> requestCount_{0};
};

TEST_F(ControlServerTest, LetsItsOwnUserInAndNobodyElse) {
  const auto server = Listen();
  ASSERT_NE(server, nullptr) << error_;
  EXPECT_EQ(ModeOf(path_), 0600U);
  EXPECT_EQ(ModeOf(path_ + ".lock"), 0600U);
  EXPECT_EQ(ModeOf(folder_.Path()), 0700U);
}

TEST_F(ControlServerTest, RefusesAFolderThatLetsOthersIn) {
  ASSERT_EQ(mkdir(folder_.Path().c_str(), 0700), 0);
  ASSERT_EQ(chmod(folder_.Path().c_str(), 0755), 0);
  EXPECT_EQ(Listen(), nullptr);
  EXPECT_NE(error_.find("mode 0700"), std::string::npos) << error_;
}

TEST_F(ControlServerTest, AnswersInOrderUnderTheId) {
  const auto server = Listen();
  ASSERT_NE(server, nullptr) << error_;
  ControlClient client(path_);
  ASSERT_TRUE(client.Send("{\"id\":1,\"text\":\"a\"}\n{\"id\":\"two\",\"text\":\"b\"}\n{\"text\""));
  Json reply = Json::parse(client.Line());
  EXPECT_EQ(reply["id"], 1);
  EXPECT_EQ(reply["data"]["echo"], "a");
  EXPECT_EQ(reply["ok"], true);
  reply = Json::parse(client.Line());
  EXPECT_EQ(reply["id"], "two");
  EXPECT_EQ(reply["data"]["echo"], "b");
  ASSERT_TRUE(client.Send(":\"c\"}\n"));
  reply = Json::parse(client.Line());
  EXPECT_FALSE(reply.contains("id"));
  EXPECT_EQ(reply["data"]["echo"], "c");
}

TEST_F(ControlServerTest, GarbageIsRefusedAndHarmsNobody) {
  const auto server = Listen();
  ASSERT_NE(server, nullptr) << error_;
  ControlClient client(path_);
  const std::string deep(200000, '[');
  const std::string closed(200000, ']');
  for (const std::string& garbage :
       {std::string(), std::string("garbage"), std::string("[]"), std::string("1"),
        std::string("\"op\""), std::string("{\"op\":"), std::string("\0\xFF\x1B", 3), deep}) {
    const Json reply = client.Ask(garbage);
    EXPECT_EQ(reply["ok"], false) << garbage.substr(0, 20);
    EXPECT_EQ(reply["status"], 2);
  }
  EXPECT_EQ(requestCount_, 0);
  EXPECT_EQ(client.Ask("{\"throw\":1}")["ok"], false);
  // An id that no answer can carry, nested so deep that copying it would need a larger stack.
  const Json reply = client.Ask("{\"id\":" + deep + closed + "}");
  EXPECT_EQ(reply["ok"], true);
  EXPECT_FALSE(reply.contains("id"));
  EXPECT_EQ(client.Ask("{\"op\":" + deep + closed + "}")["ok"], true);
  EXPECT_EQ(client.Ask("{\"text\":\"still there\"}")["data"]["echo"], "still there");
}

TEST_F(ControlServerTest, HangsUpOnALineWithoutEnd) {
  const auto server = Listen();
  ASSERT_NE(server, nullptr) << error_;
  ControlClient client(path_);
  const std::string allowed = "{\"text\":\"" + std::string(1000000, 'x') + "\"}";
  EXPECT_EQ(client.Ask(allowed)["data"]["echo"].get<std::string>().size(), 1000000U);
  (void)client.Send(std::string(3000000, 'x'));
  EXPECT_EQ(client.Line(), "(end)");
  ControlClient other(path_);
  EXPECT_EQ(other.Ask("{}")["ok"], true);
}

TEST_F(ControlServerTest, SendsEventsToThoseWhoAskForThem) {
  const auto server = Listen();
  ASSERT_NE(server, nullptr) << error_;
  ControlClient listener(path_);
  ControlClient other(path_);
  EXPECT_EQ(listener.Ask("{\"op\":\"subscribe\",\"id\":7}")["id"], 7);
  EXPECT_EQ(other.Ask("{}")["ok"], true);
  server->OnEvent(NoteOfServer("one"));
  EXPECT_EQ(listener.Line(), ToJsonLine(NoteOfServer("one")));
  EXPECT_EQ(other.Ask("{\"text\":\"mine\"}")["data"]["echo"], "mine");
}

// 4 MiB of events are far more than the socket and the server keep for one client.
TEST_F(ControlServerTest, ClientThatDoesNotReadLosesEventsAndIsTold) {
  const auto server = Listen();
  ASSERT_NE(server, nullptr) << error_;
  ControlClient lazy(path_);
  ASSERT_EQ(lazy.Ask("{\"op\":\"subscribe\"}")["ok"], true);
  constexpr int kEvents = 4096;
  const std::string text(1024, 'x');
  for (int i = 0; i < kEvents; ++i) {
    server->OnEvent(NoteOfServer(text));
  }
  // The instance goes on meanwhile.
  ControlClient other(path_);
  EXPECT_EQ(other.Ask("{}")["ok"], true);
  ASSERT_TRUE(lazy.Send("{\"id\":1}\n"));
  int events = 0;
  Json line = Json::parse(lazy.Line());
  for (; !line.contains("id"); line = Json::parse(lazy.Line())) {
    EXPECT_EQ(line["text"], text);
    ++events;
  }
  EXPECT_LT(events, kEvents);
  EXPECT_GT(events, 100);
  EXPECT_EQ(line["ok"], true);
  server->OnEvent(NoteOfServer("behind"));
  EXPECT_EQ(Json::parse(lazy.Line())["text"],
            std::to_string(kEvents - events) + " events were not read in time");
  EXPECT_EQ(Json::parse(lazy.Line())["text"], "behind");
}

TEST_F(ControlServerTest, ClientThatDoesNotReadAnswersIsNotHeardMeanwhile) {
  const auto server = Listen();
  ASSERT_NE(server, nullptr) << error_;
  ControlClient lazy(path_);
  std::string requests;
  for (int i = 0; i < 20000; ++i) {
    requests += "{\"bytes\":65536}\n";
  }
  std::size_t taken = 0;
  ControlClient other(path_);
  // Until the server has let two rounds pass without taking a byte.
  for (int idle = 0; idle < 2 && taken < requests.size();) {
    const std::size_t more = lazy.SendWithoutWaiting(requests.substr(taken));
    taken += more;
    idle = more == 0 ? idle + 1 : 0;
    ASSERT_EQ(other.Ask("{}")["ok"], true);
  }
  // 20000 answers would be 1.3 GB.
  EXPECT_LT(requestCount_, 10000);
  EXPECT_EQ(Json::parse(lazy.Line())["data"]["echo"].get<std::string>().size(), 65536U);
}

TEST_F(ControlServerTest, ClientsThatGoAwayAreForgotten) {
  const auto server = Listen();
  ASSERT_NE(server, nullptr) << error_;
  for (int i = 0; i < 300; ++i) {
    ControlClient client(path_);
    ASSERT_EQ(client.Ask("{\"op\":\"subscribe\"}")["ok"], true) << i;
    server->OnEvent(NoteOfServer("to nobody soon"));
  }
}

TEST_F(ControlServerTest, OneInstanceOfAName) {
  auto server = Listen();
  ASSERT_NE(server, nullptr) << error_;
  EXPECT_EQ(Listen(), nullptr);
  EXPECT_EQ(error_, "another instance of this name is running (" + path_ + ")");
  EXPECT_NE(Listen("com2"), nullptr) << error_;
  // The first one still answers.
  EXPECT_EQ(ControlClient(path_).Ask("{}")["ok"], true);
  server.reset();
  EXPECT_THROW(ControlClient{path_}, std::runtime_error);
  EXPECT_NE(Listen(), nullptr) << error_;
}

TEST_F(ControlServerTest, ReplacesWhatAnEndedProcessLeftBehind) {
  ASSERT_EQ(mkdir(folder_.Path().c_str(), 0700), 0);
  {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::memcpy(address.sun_path, path_.c_str(), path_.size() + 1);
    const int descriptor = socket(AF_UNIX, SOCK_STREAM, 0);
    ASSERT_EQ(bind(descriptor, reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
    (void)close(descriptor);
  }
  std::ofstream(path_ + ".lock") << "";
  const auto server = Listen();
  ASSERT_NE(server, nullptr) << error_;
  EXPECT_EQ(ControlClient(path_).Ask("{}")["ok"], true);
}

TEST_F(ControlServerTest, SaysWhenThePathIsTooLong) {
  EXPECT_EQ(Listen(std::string(200, 'x')), nullptr);
  EXPECT_NE(error_.find("too long"), std::string::npos) << error_;
}

}  // namespace
