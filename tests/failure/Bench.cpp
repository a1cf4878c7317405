// SPDX-License-Identifier: Apache-2.0
#include "tests/failure/Bench.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>

namespace Texts {

const std::string kIdent = "an-identifier-that-is-longer-than-a-short-string";
const std::string kHexText(40, 'A');
const std::string kConfig =
    "CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 mode=RS-232 "
    "Node1::model=1 Node2::model=another-model-with-a-long-name rx_prefix=02 rx_suffix=03 "
    "tx_prefix=" +
    kHexText + " tx_suffix=" + kHexText + " token_queue_size=100 gap=20 ";

}  // namespace Texts

Bench::Bench() {
  EXPECT_EQ(plugin.Init(&host), 1);
  host.Log().SetRecording(false);
  host.Faults().Clear();
}

Bench::~Bench() { End(); }

std::string Bench::End() {
  if (isEnded_) return "";
  isEnded_ = true;
  host.Faults().Clear();
  if (protocol != nullptr) {
    protocol->Stop();
    plugin.Protocols()->DeleteProtocol(protocol);
    protocol = nullptr;
  }
  // A task that the driver could not stop is the host's to end.
  ScriptedTask* const task = host.MultiTask().LastTask();
  if (task != nullptr && task->IsStarted() && !task->IsEnded() && task->IsAskedToEnd()) task->End();
  plugin.Close();
  return host.Complaints();
}

void Bench::Create() {
  IProtocol* const created = plugin.Protocols()->CreateProtocol("LOKA");
  ASSERT_NE(created, nullptr);
  protocol = static_cast<IProtocol7*>(created->ConvertTo("IProtocol7"));
}

void Bench::Run(const char* more) {
  Create();
  // The first value of a key counts.
  const std::string config = std::string("CfgVer=1 ") + more + Texts::kConfig.substr(8);
  ASSERT_NE(protocol->Config(config.c_str()), 0) << protocol->GetLastErrorString();
  Start();
  host.Line().Feed("\x02kept one\x03\x02kept two\x03");
  host.RunUntilSilent();
  host.Faults().Clear();
}

void Bench::Start() { ASSERT_NE(protocol->Start(), 0) << protocol->GetLastErrorString(); }

void Bench::MakeTag(const char* uri) {
  tag = protocol->CreateTag(uri);
  ASSERT_NE(tag, nullptr) << protocol->GetLastErrorString();
}

void Bench::SetValue(const std::string& bytes) {
  value.fill(0);
  std::copy_n(bytes.begin(), std::min(bytes.size(), value.size()), value.begin());
}

void Bench::SetNumber(unsigned int number) {
  value.fill(0);
  std::memcpy(value.data(), &number, sizeof number);
}

void Bench::Write(const char* uri, const std::string& bytes) {
  ITag* const written = protocol->CreateTag(uri);
  ASSERT_NE(written, nullptr) << uri;
  SetValue(bytes);
  ASSERT_NE(protocol->Write(written, value.data()), 0) << uri;
  protocol->FreeTag(written);
}

int Bench::TokenCount() {
  std::array<char, 40> text{};
  return protocol->DoCommand("tokens_available", text.data(), static_cast<int>(text.size()))
             ? std::atoi(text.data())
             : -1;
}

std::string Bench::Front() {
  std::array<char, 2000> text{};
  protocol->DoCommand("get", text.data(), static_cast<int>(text.size()) - 1);
  return text.data();
}

bool Bench::IsReply(const std::string& text) const { return text == reply.data(); }

std::string Bench::WhatFails() {
  if (protocol->Config(Texts::kConfig.c_str()) == 0) return "Config";
  // A task that a failed stop has left behind goes with the next stop.
  if (protocol->Start() == 0) return "Start";
  if (protocol->Stop() == 0) return "Stop";
  if (protocol->Start() == 0) return "Start after Stop";
  const std::string problem = SendsAndReceives();
  if (!problem.empty()) return problem;
  if (protocol->Stop() == 0) return "Stop again";
  if (protocol->Start() == 0) return "Start again";
  return SendsAndReceives();
}

std::string Bench::SendsAndReceives() {
  protocol->DoCommand("connect ON", reply.data(), static_cast<int>(reply.size()));
  if (!IsReply("OK")) return "connect";
  protocol->DoCommand("set_rxPrefix 02", reply.data(), static_cast<int>(reply.size()));
  protocol->DoCommand("set_rxSuffix 03", reply.data(), static_cast<int>(reply.size()));
  protocol->DoCommand("set_hexToken OFF", reply.data(), static_cast<int>(reply.size()));
  protocol->DoCommand("token_ack all", reply.data(), static_cast<int>(reply.size()));
  host.Line().Feed("\x02good\x03");
  host.RunUntilSilent();
  if (TokenCount() != 1 || Front() != "good") return "receiving";
  MakeTag("0?rx_token?string-30");
  if (tag == nullptr) return "CreateTag";
  if (protocol->Read(tag, value.data()) == 0) return "reading a token";
  if (std::strcmp(reinterpret_cast<const char*>(value.data()), "good") != 0) return "its value";
  protocol->FreeTag(tag);
  Write("0?token_ack?boolean", "\1");
  if (TokenCount() != 0) return "acknowledging";
  Write("0?tx_token?string-30", "sent");
  return "";
}
