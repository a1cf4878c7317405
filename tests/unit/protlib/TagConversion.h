// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <gtest/gtest.h>

#include <string>

#include "tests/support/GuardedBuffer.h"
#include "tests/unit/Bytes.h"
#include "tests/unit/FakeTag.h"

// Values on their way between host and device, through tags that a specification describes.

inline constexpr bool kToDevice = true;
inline constexpr bool kToHost = false;

// What a value becomes on its way; empty when the conversion failed, and the target untouched then.
inline Bytes Converted(const FakeTag& tag, const Bytes& src, bool toDevice) {
  const int room = toDevice ? tag.PackedLen() : tag.GetVarLength();
  GuardedBuffer dst(static_cast<std::size_t>(room));
  const bool done = tag.Convert(src.data(), dst.Data(), toDevice);
  EXPECT_TRUE(dst.AreGuardsIntact());
  if (!done) {
    EXPECT_TRUE(dst.IsUntouched());
    return {};
  }
  const std::string bytes = dst.Bytes();
  return Bytes(bytes.begin(), bytes.end());
}

inline Bytes ToDevice(const std::string& spec, const Bytes& value) {
  return Converted(FakeTag(spec), value, kToDevice);
}

inline Bytes ToHost(const std::string& spec, const Bytes& image) {
  return Converted(FakeTag(spec), image, kToHost);
}

// A conversion that is the same in both directions.
inline void ExpectBothWays(const std::string& spec, const Bytes& from, const Bytes& to) {
  EXPECT_EQ(ToDevice(spec, from), to) << spec;
  EXPECT_EQ(ToHost(spec, from), to) << spec;
}

inline void ExpectFailure(const std::string& spec, const Bytes& value, bool toDevice,
                          const std::string& keyword) {
  const FakeTag tag(spec);
  EXPECT_EQ(Converted(tag, value, toDevice), Bytes{}) << spec;
  EXPECT_EQ(tag.GetErrorText(), "Conversion error at: " + keyword) << spec;
}

inline void ExpectFailureBothWays(const std::string& spec, const std::string& keyword) {
  const Bytes value(static_cast<std::size_t>(FakeTag(spec).GetVarLength()), 0);
  ExpectFailure(spec, value, kToDevice, keyword);
  ExpectFailure(spec, value, kToHost, keyword);
}
