// SPDX-License-Identifier: Apache-2.0
#include "tests/plugin/ProtocolUnderTest.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <memory>

#include "tests/support/HexDump.h"

namespace {

// A tag for the length of one statement.
class TemporaryTag {
 public:
  TemporaryTag(IProtocol7* protocol, const std::string& uri)
      : protocol_(protocol), tag_(protocol->CreateTag(uri.c_str())) {
    EXPECT_NE(tag_, nullptr) << uri << ": " << protocol->GetLastErrorString();
  }
  ~TemporaryTag() { protocol_->FreeTag(tag_); }
  TemporaryTag(const TemporaryTag&) = delete;
  TemporaryTag& operator=(const TemporaryTag&) = delete;
  const ITag* Get() const { return tag_; }

 private:
  IProtocol7* protocol_;
  ITag* tag_;
};

unsigned LittleEndian(const std::string& bytes) {
  unsigned value = 0;
  for (std::size_t i = 0; i < bytes.size() && i < sizeof(value); ++i) {
    value |= static_cast<unsigned>(static_cast<unsigned char>(bytes[i])) << (8U * i);
  }
  return value;
}

}  // namespace

ProtocolUnderTest::ProtocolUnderTest(PluginUnderTest& plugin) : plugin_(plugin) {
  IProtocol* first = plugin.Protocols()->CreateProtocol("LOKA");
  if (first != nullptr) protocol_ = static_cast<IProtocol7*>(first->ConvertTo("IProtocol7"));
  EXPECT_NE(protocol_, nullptr);
}

ProtocolUnderTest::~ProtocolUnderTest() { Delete(); }

void ProtocolUnderTest::Delete() {
  plugin_.Protocols()->DeleteProtocol(protocol_);
  protocol_ = nullptr;
}

std::string ProtocolUnderTest::Error() const {
  return std::to_string(protocol_->GetLastError()) + " " + protocol_->GetLastErrorString();
}

ReadOutcome ProtocolUnderTest::Read(const ITag* tag) {
  GuardedBuffer buffer(static_cast<std::size_t>(tag->GetVarLength()));
  ReadOutcome outcome;
  outcome.result = protocol_->Read(tag, buffer.Data());
  EXPECT_TRUE(buffer.AreGuardsIntact()) << tag->GetVarName();
  outcome.untouched = buffer.IsUntouched();
  outcome.bytes = buffer.Bytes();
  return outcome;
}

ReadOutcome ProtocolUnderTest::ReadBlock(const ITag* tag, int lengthBytes) {
  GuardedBuffer buffer(static_cast<std::size_t>(lengthBytes < 0 ? 0 : lengthBytes));
  ReadOutcome outcome;
  outcome.result = protocol_->ReadBlock(tag, buffer.Data(), lengthBytes);
  EXPECT_TRUE(buffer.AreGuardsIntact());
  outcome.untouched = buffer.IsUntouched();
  outcome.bytes = buffer.Bytes();
  return outcome;
}

unsigned ProtocolUnderTest::ReadNumber(const std::string& memoryType) {
  const TemporaryTag tag(protocol_, "0?" + memoryType + "?unsignedInt");
  const ReadOutcome outcome = Read(tag.Get());
  EXPECT_NE(outcome.result, 0) << memoryType << ": " << Error();
  return LittleEndian(outcome.bytes);
}

unsigned ProtocolUnderTest::ReadByte(const std::string& memoryType) {
  const TemporaryTag tag(protocol_, "0?" + memoryType + "?unsignedByte");
  const ReadOutcome outcome = Read(tag.Get());
  EXPECT_NE(outcome.result, 0) << memoryType << ": " << Error();
  return LittleEndian(outcome.bytes);
}

bool ProtocolUnderTest::ReadFlag(const std::string& memoryType) {
  const TemporaryTag tag(protocol_, "0?" + memoryType + "?boolean");
  const ReadOutcome outcome = Read(tag.Get());
  EXPECT_NE(outcome.result, 0) << memoryType << ": " << Error();
  EXPECT_LE(LittleEndian(outcome.bytes), 1U);
  return LittleEndian(outcome.bytes) != 0;
}

std::string ProtocolUnderTest::ReadText(const std::string& memoryType, int declaredLength) {
  const TemporaryTag tag(protocol_,
                         "0?" + memoryType + "?string-" + std::to_string(declaredLength));
  const ReadOutcome outcome = Read(tag.Get());
  if (outcome.result == 0) return "failed: " + Error();
  return outcome.bytes.substr(0, outcome.bytes.find('\0'));
}

bool ProtocolUnderTest::Write(const ITag* tag, const std::string& value) {
  // Exactly as long as the tag's value, so that a read behind it is noticed by the sanitizer.
  const auto size = static_cast<std::size_t>(tag->GetVarLength());
  const std::unique_ptr<unsigned char[]> bytes(new unsigned char[size]());
  std::copy_n(value.begin(), std::min(size, value.size()), bytes.get());
  return protocol_->Write(tag, bytes.get()) != 0;
}

bool ProtocolUnderTest::WriteNumber(const std::string& memoryType, unsigned value) {
  const TemporaryTag tag(protocol_, "0?" + memoryType + "?unsignedInt");
  std::string bytes;
  for (unsigned shift = 0; shift < 32; shift += 8) {
    bytes += static_cast<char>(static_cast<unsigned char>(value >> shift));
  }
  return Write(tag.Get(), bytes);
}

bool ProtocolUnderTest::WriteByte(const std::string& memoryType, unsigned value) {
  const TemporaryTag tag(protocol_, "0?" + memoryType + "?unsignedByte");
  return Write(tag.Get(), std::string(1, static_cast<char>(static_cast<unsigned char>(value))));
}

bool ProtocolUnderTest::WriteFlag(const std::string& memoryType, unsigned value) {
  const TemporaryTag tag(protocol_, "0?" + memoryType + "?boolean");
  return Write(tag.Get(), std::string(1, static_cast<char>(static_cast<unsigned char>(value))));
}

bool ProtocolUnderTest::WriteText(const std::string& memoryType, const std::string& text,
                                  int declaredLength) {
  const TemporaryTag tag(protocol_,
                         "0?" + memoryType + "?string-" + std::to_string(declaredLength));
  return Write(tag.Get(), text);
}

std::string ProtocolUnderTest::TakeTokens() {
  std::string all;
  while (ReadNumber("tokens_available") != 0) {
    const unsigned length = ReadNumber("rx_token_len");
    const std::string text = ReadText("rx_token", 3000);
    all += "[" + text + (text.size() == length ? "]" : "|" + std::to_string(length) + "]");
    if (!WriteFlag("token_ack", 1)) return all + "acknowledge failed";
  }
  return all;
}

std::string ProtocolUnderTest::ComParams() {
  GuardedBuffer buffer(400);
  EXPECT_EQ(protocol_->vcsGetComParams(buffer.Chars(), 400), 1);
  EXPECT_TRUE(buffer.AreGuardsIntact());
  const std::string bytes = buffer.Bytes();
  return bytes.substr(0, bytes.find('\0'));
}
