// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/instance/Answer.h"

namespace {

using Json = nlohmann::json;

TEST(Answer, IsReadBackAsItWasWritten) {
  Answer answer = Refusal("no room", ExitStatus::kPort);
  answer.errorCode = -1;
  answer.hints = {"a", "b"};
  answer.data = {{"count", 3}};
  Answer read;
  ASSERT_TRUE(FromJson(ToJson(answer), &read));
  EXPECT_EQ(ToJson(read), ToJson(answer));
  EXPECT_EQ(read.status, ExitStatus::kPort);
  EXPECT_EQ(read.errorCode, -1);
  EXPECT_EQ(ToJson(answer)["ok"], false);
  EXPECT_EQ(ToJson(Answer())["ok"], true);
}

TEST(Answer, WhatIsNoAnswerIsRefused) {
  const Json good = ToJson(Answer());
  Answer read = Refusal("untouched");
  for (const char* const key : {"ok", "status", "text", "code", "hints", "data"}) {
    Json missing = good;
    missing.erase(key);
    EXPECT_FALSE(FromJson(missing, &read)) << key;
    Json wrong = good;
    wrong[key] = key == std::string("data") ? Json() : Json::array({Json::object()});
    EXPECT_EQ(FromJson(wrong, &read), key == std::string("data")) << key;
  }
  Json contradiction = good;
  contradiction["ok"] = false;
  EXPECT_FALSE(FromJson(contradiction, &read));
  EXPECT_FALSE(FromJson(Json::array(), &read));
  EXPECT_FALSE(FromJson(Json(), &read));
}

}  // namespace
