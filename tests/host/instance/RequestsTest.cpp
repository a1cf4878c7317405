// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <atomic>
#include <thread>

#include "host/control/AttachedInstance.h"
#include "host/events/EventSink.h"
#include "host/instance/LocalInstance.h"
#include "host/instance/Requests.h"
#include "host/port/PseudoTerminal.h"
#include "host/text/ByteText.h"
#include "tests/host/control/ControlFolder.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/support/TestLimit.h"
#include "tests/support/PluginLibrary.h"

namespace {

using Json = nlohmann::json;

class EventLog final : public EventSink {
 public:
  void OnEvent(const HostEvent& event) override {
    if (const auto* const token = std::get_if<TokenReceived>(&event.detail)) {
      tokens.push_back(token->bytes);
    } else if (const auto* const port = std::get_if<PortChanged>(&event.detail)) {
      ports.push_back(port->state);
    } else if (const auto* const setting = std::get_if<SettingChanged>(&event.detail)) {
      settings.push_back(setting->state + " " + setting->key + " " + setting->value);
    } else if (std::holds_alternative<FindingMade>(event.detail)) {
      ++findings;
    }
  }
  std::vector<std::string> tokens;
  std::vector<std::string> ports;
  std::vector<std::string> settings;
  int findings = 0;
};

class RequestsTest : public testing::Test {
 protected:
  void Open(const std::string& more, bool acknowledges = false) {
    LocalInstance::Options options;
    options.instance.portWords = {line_.Path()};
    options.instance.configuration = TestConfiguration(more);
    options.instance.pluginFile = PluginLibrary::DefaultPath();
    options.instance.storeFile = folder_.Parent().File("store.db");
    options.acknowledges = acknowledges;
    Answer answer;
    instance_ = LocalInstance::Open(options, &answer);
    ASSERT_NE(instance_, nullptr) << answer.text;
    instance_->Events()->Add(&log_);
  }
  void TearDown() override {
    if (instance_ != nullptr) {
      instance_->Events()->Remove(&log_);
    }
  }

  Answer Call(const Json& request) { return instance_->Call(request); }
  std::string Read(const std::string& uri) {
    const Answer answer = Call({{"op", "read"}, {"uri", uri}});
    std::string bytes;
    (void)ParseHexBytes(answer.data.value("value", ""), &bytes);
    return answer.IsDone() ? bytes : "refused: " + answer.text;
  }
  Answer Write(const std::string& uri, const std::string& value) {
    return Call({{"op", "write"}, {"uri", uri}, {"value", CompactHex(value)}});
  }
  Answer Console(const std::string& line) {
    return Call({{"op", "console"}, {"line", CompactHex(line)}});
  }
  std::string SentBytes(std::size_t count) {
    std::string sent;
    (void)line_.Receive(count, Deadline::After(kLimitMs), &sent);
    return sent;
  }
  bool AwaitWaiting(unsigned int count) {
    const Deadline deadline = Deadline::After(kLimitMs);
    while (Call({{"op", "waiting"}}).data["count"] != count) {
      if (deadline.HasPassed()) {
        return false;
      }
      Deadline::After(2).Sleep();
    }
    return true;
  }

  const ControlFolderForTest folder_;
  const PseudoTerminal line_;
  EventLog log_;
  std::unique_ptr<LocalInstance> instance_;
};

TEST_F(RequestsTest, ALineWithoutModemLinesTellsNoLevels) {
  Open("");
  const Answer answer = Call({{"op", "lines"}});
  EXPECT_TRUE(answer.IsDone());
  EXPECT_EQ(answer.data, Json::object());
}

TEST_F(RequestsTest, RefusesWhatIsNoRequest) {
  Open("");
  const std::string deep = std::string(1000, '[') + std::string(1000, ']');
  for (const Json& wrong :
       {Json(), Json::array(), Json("read"), Json::object(), Json({{"op", 1}}),
        Json({{"op", "bogus"}}), Json({{"op", "read"}}), Json({{"op", "read"}, {"uri", 5}}),
        Json({{"op", "write"}, {"uri", "0?tx_token?string-9"}}),
        Json({{"op", "write"}, {"uri", "0?tx_token?string-9"}, {"value", "4"}}),
        Json({{"op", "console"}, {"line", "xyz"}}), Json({{"op", "send"}}),
        Json({{"op", "send"}, {"hex", Json::array()}}), Json({{"op", "stage"}, {"key", "gap"}}),
        Json({{"op", "stage"}, {"key", "bogus"}, {"value", "1"}}),
        Json({{"op", "stage"}, {"key", "bits"}, {"value", "9"}}), Json({{"op", "connect"}}),
        Json({{"op", "connect"}, {"state", "maybe"}}), Json({{"op", Json::parse(deep)}})}) {
    const Answer answer = Call(wrong);
    EXPECT_EQ(answer.status, ExitStatus::kUsage) << wrong;
    EXPECT_NE(answer.text, "") << wrong;
  }
  EXPECT_TRUE(Call({{"op", "ack"}, {"all", "yes"}}).IsDone());
  EXPECT_TRUE(log_.settings.empty());
}

TEST_F(RequestsTest, TellsWhoItIs) {
  Open("", true);
  const Json info = Call({{"op", "info"}}).data;
  EXPECT_EQ(info["port"], "com1");
  EXPECT_EQ(info["path"], line_.Path());
  EXPECT_EQ(info["pid"], getpid());
  EXPECT_EQ(info["ident"], "com1");
  EXPECT_EQ(info["store"], folder_.Parent().File("store.db"));
  EXPECT_EQ(info["ack"], true);
}

TEST_F(RequestsTest, MemoryTypesMayHaveBlanksAround) {
  Open("");
  EXPECT_EQ(Write("0? SP_Gap ?unsignedInt", "30").data["key"], "gap");
  EXPECT_EQ(Write("0? SP_Done ?boolean", "1").data["applied"][0]["value"], "30");
}

TEST_F(RequestsTest, GivesTheDriversNumber) {
  Open("");
  const Answer baud = Write("0?SP_Baud?unsignedInt", "1");
  EXPECT_EQ(baud.text, "illegal baudrate intValue");
  EXPECT_EQ(baud.errorCode, -1);
  const Answer conversion = Call({{"op", "read"}, {"uri", "0?SP_Gap?unsignedInt(bogus)"}});
  EXPECT_EQ(conversion.text, "read conversion error");
  EXPECT_EQ(conversion.errorCode, -9);
  // What the driver does not explain has no number either.
  EXPECT_EQ(Write("0?SP_Bits?unsignedByte", "9").errorCode, 0);
}

TEST_F(RequestsTest, SendsByTheModeInEffectNotTheStagedOne) {
  Open("tx_suffix=0D");
  ASSERT_TRUE(Call({{"op", "stage"}, {"key", "hex_tokens"}, {"value", "true"}}).IsDone());
  EXPECT_TRUE(Call({{"op", "send"}, {"hex", "4142"}}).IsDone());
  EXPECT_EQ(SentBytes(3), "AB\r");
  // A plain token cannot hold a zero byte.
  EXPECT_EQ(Call({{"op", "send"}, {"hex", "4100"}}).status, ExitStatus::kUsage);
  ASSERT_TRUE(Console("set_hexToken ON").IsDone());
  EXPECT_TRUE(Call({{"op", "send"}, {"hex", "4100"}}).IsDone());
  EXPECT_EQ(SentBytes(3), std::string("A\0\r", 3));
  ASSERT_TRUE(Console("set_hexToken OFF").IsDone());
  EXPECT_TRUE(Call({{"op", "send"}, {"hex", "43"}}).IsDone());
  EXPECT_EQ(SentBytes(2), "C\r");
}

TEST_F(RequestsTest, TellsEveryChangeOfThePort) {
  Open("");
  log_.ports.clear();
  EXPECT_TRUE(Call({{"op", "connect"}, {"state", "on"}}).IsDone());
  EXPECT_TRUE(log_.ports.empty());
  EXPECT_TRUE(Console("connect OFF").IsDone());
  EXPECT_TRUE(Write("0?connect?boolean", "1").IsDone());
  EXPECT_TRUE(Call({{"op", "connect"}, {"state", "off"}}).IsDone());
  EXPECT_EQ(log_.ports, (std::vector<std::string>{"closed", "open", "closed"}));
}

TEST_F(RequestsTest, FollowsSettingsFromStagedToStored) {
  Open("gap=20");
  Answer answer = Call({{"op", "stage"}, {"key", "gap"}, {"value", "40"}});
  EXPECT_EQ(answer.data, Json({{"key", "gap"}, {"value", "40"}, {"active", "20"}}));
  answer = Call({{"op", "done"}});
  EXPECT_EQ(answer.data["stored"], true);
  EXPECT_EQ(answer.data["applied"],
            Json::array({{{"key", "gap"}, {"value", "40"}, {"previous", "20"}}}));
  EXPECT_EQ(log_.settings,
            (std::vector<std::string>{"staged gap 40", "applied gap 40", "stored gap 40"}));
  // The console changes what is in effect, and nothing else.
  ASSERT_TRUE(Console("set_rxGap 60").IsDone());
  Json row;
  const Json rows = Call({{"op", "settings"}}).data["rows"];
  for (const Json& entry : rows) {
    row = entry["key"] == "gap" ? entry : row;
  }
  EXPECT_EQ(row, Json({{"key", "gap"},
                       {"configured", "20"},
                       {"active", "40"},
                       {"stored", "40"},
                       {"console", "60"}}));
}

TEST_F(RequestsTest, AcknowledgesOneOrAll) {
  Open("rx_suffix=03");
  ASSERT_TRUE(
      line_.Send("A\x03"
                 "B\x03"
                 "C\x03",
                 Deadline::After(kLimitMs)));
  ASSERT_TRUE(AwaitWaiting(3));
  EXPECT_EQ(Call({{"op", "ack"}}).data["dropped"], 1);
  EXPECT_EQ(Read("0?rx_token?string-9"), "B");
  EXPECT_EQ(Call({{"op", "ack"}, {"all", true}}).data["dropped"], 2);
  EXPECT_EQ(Call({{"op", "ack"}}).data["dropped"], 0);
}

TEST_F(RequestsTest, StagedHexModeDoesNotChangeHowTokensAreRead) {
  Open("rx_suffix=03 gap=20", true);
  ASSERT_TRUE(Call({{"op", "stage"}, {"key", "hex_tokens"}, {"value", "true"}}).IsDone());
  ASSERT_TRUE(line_.Send("41\x03", Deadline::After(kLimitMs)));
  EventLog served;
  const Answer answer = instance_->Serve(
      &served, [&] { return !served.tokens.empty(); }, Deadline::After(kLimitMs));
  EXPECT_TRUE(answer.IsDone()) << answer.text;
  EXPECT_EQ(served.tokens, std::vector<std::string>{"41"});
}

// "deletetags" destroys every tag of the driver, those of the pump too.
TEST_F(RequestsTest, DeletingTagsWhileTokensArePumpedHarmsNothing) {
  // Room for all: the pump may be slower than the device.
  Open("rx_suffix=03 token_queue_size=1000", true);
  std::string error;
  ASSERT_TRUE(instance_->Share(&error)) << error;
  constexpr std::size_t kTokens = 300;
  std::atomic<bool> isOver{false};
  std::atomic<int> deletions{0};
  std::thread deleter([&] {
    std::string reason;
    const auto client = AttachedInstance::Connect("com1", &reason);
    while (client != nullptr && !isOver) {
      const Answer answer = client->Call({{"op", "console"}, {"line", CompactHex("deletetags")}});
      deletions += answer.status == ExitStatus::kPortLost ? 0 : 1;
      (void)client->Call({{"op", "read"}, {"uri", "0?rx_token?string-64"}});
    }
  });
  std::thread device([&] {
    for (std::size_t i = 0; i < kTokens; ++i) {
      (void)line_.Send("T" + std::to_string(i) + "\x03", Deadline::After(kLimitMs));
    }
  });
  EventLog served;
  const Answer answer = instance_->Serve(
      &served, [&] { return served.tokens.size() >= kTokens && deletions > 10; },
      Deadline::After(kLimitMs));
  isOver = true;
  deleter.join();
  device.join();
  EXPECT_TRUE(answer.IsDone()) << answer.text;
  ASSERT_EQ(served.tokens.size(), kTokens);
  for (std::size_t i = 0; i < kTokens; ++i) {
    EXPECT_EQ(served.tokens[i], "T" + std::to_string(i));
  }
  EXPECT_EQ(served.findings, 0);
}

TEST_F(RequestsTest, SecondInstanceOfAPortCannotShareTheName) {
  Open("");
  std::string error;
  ASSERT_TRUE(instance_->Share(&error)) << error;
  EXPECT_EQ(ControlServer::Listen(
                "com1", [](const Json&) { return Answer(); }, &error),
            nullptr);
  EXPECT_NE(error.find("another instance of this name is running"), std::string::npos) << error;
}

}  // namespace
