// SPDX-License-Identifier: Apache-2.0
#include "tests/docs/DriverInUse.h"

#include <gtest/gtest.h>

#include <array>
#include <cstring>
#include <sstream>

#include "driver/HexText.h"
#include "interfaces/ITag.h"
#include "protlib/HostInterfaces.h"

DriverInUse::DriverInUse() {
  piMultiTask = &host_.MultiTask();
  piSerialFactory = &host_.SerialFactory();
  piPermanentStorage = &host_.Storage();
  driver_ = std::make_unique<Protocol_LOKA>();
}

DriverInUse::~DriverInUse() {
  driver_->Stop();
  driver_.reset();
  piMultiTask = nullptr;
  piSerialFactory = nullptr;
  piPermanentStorage = nullptr;
}

std::string DriverInUse::Config(const std::string& text) {
  return driver_->Config(text.c_str()) != 0 ? "" : driver_->GetLastErrorString();
}

bool DriverInUse::Start(const std::string& text) {
  const std::string problem = Config(text);
  const bool isStarted = problem.empty() && driver_->Start() != 0;
  EXPECT_TRUE(isStarted) << driver_->GetLastErrorString() << " with " << text;
  return isStarted;
}

std::string DriverInUse::TagError(const std::string& uri) {
  ITag* const tag = driver_->CreateTag(uri.c_str());
  if (tag == nullptr) return driver_->GetLastErrorString();
  driver_->FreeTag(tag);
  return "";
}

std::string DriverInUse::Command(const std::string& line, bool& result) {
  std::array<char, 4096> reply{};
  result = driver_->DoCommand(line.c_str(), reply.data(), static_cast<int>(reply.size()));
  std::string text = reply.data();
  if (!text.empty() && text.back() == '\n') text.pop_back();
  return text;
}

void DriverInUse::Receive(const std::string& bytes, const std::string& port) {
  host_.Line(port).Feed(bytes);
  host_.RunUntilSilent(port);
}

bool DriverInUse::Read(const std::string& uri, std::string& value) {
  ITag* const tag = driver_->CreateTag(uri.c_str());
  if (tag == nullptr) return false;
  value.assign(static_cast<std::size_t>(tag->GetVarLength()), '\0');
  const bool isRead = driver_->Read(tag, reinterpret_cast<unsigned char*>(value.data())) != 0;
  driver_->FreeTag(tag);
  return isRead;
}

bool DriverInUse::Write(const std::string& uri, std::string value) {
  ITag* const tag = driver_->CreateTag(uri.c_str());
  if (tag == nullptr) return false;
  value.resize(static_cast<std::size_t>(tag->GetVarLength()), '\0');
  const bool isWritten =
      driver_->Write(tag, reinterpret_cast<const unsigned char*>(value.data())) != 0;
  driver_->FreeTag(tag);
  return isWritten;
}

std::string DriverInUse::TakeToken() {
  std::string text;
  EXPECT_TRUE(Read("0?rx_token?string-2001", text)) << driver_->GetLastErrorString();
  EXPECT_TRUE(Write("0?token_ack?boolean", "\x01"));
  return text.c_str();
}

int DriverInUse::TokensAvailable() {
  std::string bytes;
  EXPECT_TRUE(Read("0?tokens_available?unsignedInt", bytes));
  int count = 0;
  std::memcpy(&count, bytes.data(), sizeof count);
  return count;
}

std::string BytesFrom(const std::string& hexDump) {
  std::string bytes;
  std::istringstream stream(hexDump);
  for (std::string hex; stream >> hex;) {
    EXPECT_TRUE(hex.size() == 2 && isHex(hex.c_str())) << hex;
    bytes += fromHex(hex);
  }
  return bytes;
}
