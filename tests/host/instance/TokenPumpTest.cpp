// SPDX-License-Identifier: Apache-2.0
// What the driver queued against what is known of the line. The driver gets its bytes from a
// pseudo-terminal; what the pump is told of them is made up here.
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "host/events/EventSink.h"
#include "host/events/EventStream.h"
#include "host/events/Statistics.h"
#include "host/instance/Requests.h"
#include "host/instance/TokenPump.h"
#include "host/port/PseudoTerminal.h"
#include "host/runtime/HostSession.h"
#include "tests/host/port/CountingObserver.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/support/TestLimit.h"
#include "tests/support/PluginLibrary.h"

namespace {

class PumpLog final : public EventSink {
 public:
  void OnEvent(const HostEvent& event) override {
    if (const auto* const token = std::get_if<TokenReceived>(&event.detail)) {
      tokens.push_back(token->bytes);
    } else if (const auto* const finding = std::get_if<FindingMade>(&event.detail)) {
      findings.push_back(finding->text);
    } else if (const auto* const note = std::get_if<NoteMade>(&event.detail)) {
      missedBytes += note->missedBytes;
    }
  }
  std::vector<std::string> tokens;
  std::vector<std::string> findings;
  std::uint64_t missedBytes = 0;
};

LineRecord Record(LineRecord::Kind kind, const std::string& bytes = "") {
  LineRecord record;
  record.kind = kind;
  record.bytes = bytes;
  record.silenceMs = kind == LineRecord::Kind::kSilence ? 20 : 0;
  return record;
}

LineRecord Served(const std::string& token) {
  return Record(LineRecord::Kind::kServed, "\x02" + token + "\x03");
}

LineRecord Missed(std::uint64_t bytes) {
  LineRecord record = Record(LineRecord::Kind::kMissed);
  record.missedBytes = bytes;
  return record;
}

class TokenPumpTest : public testing::Test {
 protected:
  void SetUp() override {
    HostOptions options;
    options.pluginFile = PluginLibrary::DefaultPath();
    options.observer = &observer_;
    std::string error;
    ASSERT_TRUE(options.ports.Add(line_.Path(), &error)) << error;
    session_ = std::make_unique<HostSession>(options);
    ASSERT_TRUE(session_->Open().IsDone());
    ASSERT_TRUE(
        session_->Configure(TestConfiguration("gap=20 rx_prefix=02 rx_suffix=03")).IsDone());
    requests_ = std::make_unique<Requests>(session_.get(), &events_, &statistics_,
                                           Requests::Info{line_.Path(), "", "", true});
    ASSERT_TRUE(session_->Start().IsDone());
    requests_->ReadActiveSettings();
    pump_ = std::make_unique<TokenPump>(session_.get(), &events_, requests_.get(), true);
    events_.Add(&log_);
    events_.Add(&statistics_);
  }
  void TearDown() override {
    pump_.reset();
    requests_.reset();
    session_.reset();
  }

  // The driver receives the tokens and has queued them.
  void DriverGets(const std::vector<std::string>& tokens) {
    for (const std::string& token : tokens) {
      const std::string frame = Served(token).bytes;
      sentBytes_ += frame.size();
      ASSERT_TRUE(line_.Send(frame, Deadline::After(kLimitMs)));
    }
    ASSERT_TRUE(observer_.AwaitBytes(sentBytes_, kLimitMs));
  }

  // The pump is told of the line, takes all tokens of the driver, and a silence follows.
  void PumpIsTold(const std::vector<LineRecord>& records) {
    ASSERT_TRUE(pump_->Run(records, [] { return false; }).IsDone());
    while (pump_->IsWaitingForLine()) {
      Deadline::After(5).Sleep();
      ASSERT_TRUE(pump_->Run({}, [] { return false; }).IsDone());
    }
    ASSERT_TRUE(pump_->Run({Record(LineRecord::Kind::kSilence)}, [] { return false; }).IsDone());
  }

  PseudoTerminal line_;
  CountingObserver observer_;
  EventStream events_{"com1"};
  Statistics statistics_;
  PumpLog log_;
  std::unique_ptr<HostSession> session_;
  std::unique_ptr<Requests> requests_;
  std::unique_ptr<TokenPump> pump_;
  std::uint64_t sentBytes_ = 0;
};

TEST_F(TokenPumpTest, WhatDriverAndLineAgreeOnIsNoFinding) {
  DriverGets({"one", "two"});
  PumpIsTold({Served("one"), Served("two")});
  EXPECT_EQ(log_.tokens, (std::vector<std::string>{"one", "two"}));
  EXPECT_TRUE(log_.findings.empty()) << log_.findings.front();
}

TEST_F(TokenPumpTest, ATokenThatTheLineDoesNotGiveIsAFinding) {
  DriverGets({"one", "two", "three"});
  PumpIsTold({Served("one"), Served("three")});
  ASSERT_EQ(log_.findings.size(), 1U);
  EXPECT_NE(log_.findings.front().find("\"two\""), std::string::npos) << log_.findings.front();
}

TEST_F(TokenPumpTest, TokensOfMissedBytesAreShownAndNotCompared) {
  DriverGets({"one", "two", "three"});
  PumpIsTold({Served("one"), Missed(5), Served("three")});
  EXPECT_EQ(log_.tokens, (std::vector<std::string>{"one", "two", "three"}));
  EXPECT_TRUE(log_.findings.empty()) << log_.findings.front();
  EXPECT_EQ(log_.missedBytes, 5U);
}

TEST_F(TokenPumpTest, ComparingGoesOnBehindMissedBytes) {
  DriverGets({"one", "two"});
  PumpIsTold({Served("one"), Missed(5)});
  DriverGets({"three", "four", "five"});
  PumpIsTold({Served("three"), Served("five")});
  ASSERT_EQ(log_.findings.size(), 1U);
  EXPECT_NE(log_.findings.front().find("\"four\""), std::string::npos) << log_.findings.front();
}

}  // namespace
