// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <gtest/gtest.h>

#include <cstring>
#include <memory>
#include <string>

#include "protlib/ProtocolBase.h"
#include "tests/unit/Bytes.h"
#include "tests/unit/FakeTag.h"

// The least that a driver has to supply: it holds one image that every block read copies out and
// every write replaces. Tag URIs are type specifications; any other text is refused.
class FakeDriver : public ProtocolBase {
 public:
  const char* GetImpName() const override { return "FakeDriver"; }
  int GetImpVersion() const override { return 5; }
  int Config(const char* /*configuration*/) override { return 1; }
  bool CanBeOptimized(const ITag* /*first*/, const ITag* /*second*/,
                      bool /*forWrite*/) const override {
    return false;
  }
  const char* GetName() const override { return "FAKE"; }
  const char* GetProtocolName() const override { return "Fake Driver"; }
  int GetProtocolVersion() const override { return 1; }
  int GetProtocolType() const override { return 2; }
  int GetNodeID(const ITag* /*tag*/) const override { return 0; }
  int GetMaxTm(const ITag* /*tag*/) const override { return 0; }

  TagBase* CreateTagBase(const char* uri) override {
    auto tag = std::make_unique<FakeTag>(std::string(uri));
    tag->uri = uri;
    if (tag->type == ICU_NONE) {
      tag->SetError("no such type");
      SetTagError(tag.get());
      return nullptr;
    }
    return tag.release();
  }

  int ReadBlock(const ITag* /*tag*/, unsigned char* buffer, int lengthBytes) override {
    ++blockReads;
    lastReadBytes = lengthBytes;
    if (!readsSucceed) {
      SetError(-42, "device silent");
      return 0;
    }
    std::memcpy(buffer, image.data(), static_cast<std::size_t>(lengthBytes));
    return readResult;
  }

  int Write(const ITag* tag, const unsigned char* value) override {
    written.assign(value, value + tag->GetVarLength());
    return writeResult;
  }

  // The protected operations, for the test.
  void RecordError(int code, const char* text) const { SetError(code, text); }
  void RecordTagError(const TagBase* tag) const { SetTagError(tag); }
  template <typename Result, typename Body>
  Result RunGuarded(Result onFailure, Body&& body) const {
    return Guarded(onFailure, std::forward<Body>(body));
  }

  Bytes image = Bytes(4096);
  Bytes written;
  int blockReads = 0;
  int lastReadBytes = -1;
  bool readsSucceed = true;
  int readResult = 1;
  int writeResult = 1;
};

// What the driver reports last.
inline void ExpectError(const IProtocol& driver, int code, const char* text) {
  EXPECT_EQ(driver.GetLastError(), code);
  EXPECT_STREQ(driver.GetLastErrorString(), text);
}
