// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/commands/StoreJson.h"

namespace {

TEST(StoreJson, KeepsEveryValueWithItsKind) {
  std::string bytes;
  for (int value = 1; value < 256; ++value) {
    bytes += static_cast<char>(static_cast<unsigned char>(value));
  }
  const SqliteFile::Values values = {{{"com1", "gap"}, 5},
                                     {{"com1", "hex_tokens"}, false},
                                     {{"com1", "rx_suffix"}, std::string("0D0A")},
                                     {{"scale \"2\"", "other"}, bytes},
                                     {{"", "lowest"}, -2147483647 - 1},
                                     {{"", "text"}, std::string("\xC3\xA4 1")}};
  SqliteFile::Values read;
  std::string error;
  ASSERT_TRUE(ParseStoreJson(StoreJson(values), &read, &error)) << error;
  EXPECT_EQ(read, values);
}

TEST(StoreJson, RefusesAValueOfAnotherKind) {
  SqliteFile::Values read = {{{"a", "b"}, 1}};
  std::string error;
  EXPECT_FALSE(ParseStoreJson(R"({"com1":{"baud":"9600"}})", &read, &error));
  EXPECT_EQ(error, "baud of com1 must be a number");
  EXPECT_FALSE(ParseStoreJson(R"({"com1":{"hex_tokens":1}})", &read, &error));
  EXPECT_EQ(error, "hex_tokens of com1 must be true or false");
  EXPECT_FALSE(ParseStoreJson(R"({"com1":{"rx_suffix":13}})", &read, &error));
  EXPECT_EQ(error, "rx_suffix of com1 must be a text of hexadecimal digits");
  EXPECT_EQ(read.size(), 1U);
}

TEST(StoreJson, RefusesNumbersThatDoNotFit) {
  SqliteFile::Values read;
  std::string error;
  for (const char* const text :
       {R"({"a":{"b":2147483648}})", R"({"a":{"b":-2147483649}})",
        R"({"a":{"b":18446744073709551615}})", R"({"a":{"b":1e3}})", R"({"a":{"b":[]}})",
        R"({"a":{"b":{"hex":"0"}}})", R"({"a":{"b":{"hex":"00"}}})", R"({"a":[]})", "7", ""}) {
    EXPECT_FALSE(ParseStoreJson(text, &read, &error)) << text;
  }
  EXPECT_TRUE(read.empty());
}

}  // namespace
