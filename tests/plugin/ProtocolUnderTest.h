// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "interfaces/IProtocol7.h"
#include "interfaces/ITag.h"
#include "tests/support/GuardedBuffer.h"
#include "tests/support/PluginUnderTest.h"

// What one read gave: its result and, after a success, the bytes of the caller's buffer.
struct ReadOutcome {
  int result = 0;
  std::string bytes;
  bool untouched = false;  // nothing was written into the buffer
};

// One protocol instance and the everyday steps of a host: configuration, tags by URI, values as
// numbers and texts. Every read goes through a guarded buffer. Deletes the protocol when it goes.
class ProtocolUnderTest {
 public:
  explicit ProtocolUnderTest(PluginUnderTest& plugin);
  ~ProtocolUnderTest();
  ProtocolUnderTest(const ProtocolUnderTest&) = delete;
  ProtocolUnderTest& operator=(const ProtocolUnderTest&) = delete;

  IProtocol7* operator->() const { return protocol_; }
  IProtocol7* Get() const { return protocol_; }
  void Delete();

  bool Config(const std::string& text) { return protocol_->Config(text.c_str()) != 0; }
  // Null when the URI is refused.
  ITag* Tag(const std::string& uri) { return protocol_->CreateTag(uri.c_str()); }
  // "code text" of the error state.
  std::string Error() const;

  ReadOutcome Read(const ITag* tag);
  ReadOutcome ReadBlock(const ITag* tag, int lengthBytes);
  // Reads a value through a tag of its own: "0?<memory type>?<data type>".
  unsigned ReadNumber(const std::string& memoryType);
  unsigned ReadByte(const std::string& memoryType);
  bool ReadFlag(const std::string& memoryType);
  std::string ReadText(const std::string& memoryType, int declaredLength = 200);

  bool Write(const ITag* tag, const std::string& value);
  bool WriteNumber(const std::string& memoryType, unsigned value);
  bool WriteByte(const std::string& memoryType, unsigned value);
  bool WriteFlag(const std::string& memoryType, unsigned value);
  bool WriteText(const std::string& memoryType, const std::string& text, int declaredLength = 200);

  // All queued tokens, oldest first, each acknowledged.
  std::string TakeTokens();

  std::string ComParams();

 private:
  PluginUnderTest& plugin_;
  IProtocol7* protocol_ = nullptr;
};
