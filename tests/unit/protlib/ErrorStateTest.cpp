// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>
#include <thread>
#include <vector>

#include "protlib/ErrorState.h"
#include "tests/unit/FailingNew.h"

TEST(ErrorStateTest, StartsWithOneAndNoText) {
  ErrorState error;
  EXPECT_EQ(error.Code(), 1);
  EXPECT_STREQ(error.HandOutText(), "");
}

TEST(ErrorStateTest, OnlyTheLastErrorRemains) {
  ErrorState error;
  error.Set(-1, "first");
  error.Set(-9, "second");
  EXPECT_EQ(error.Code(), -9);
  EXPECT_STREQ(error.HandOutText(), "second");
}

TEST(ErrorStateTest, CopiesTheText) {
  ErrorState error;
  std::string text = "a text that is longer than any small-string buffer";
  error.Set(-1, text.c_str());
  text.assign(text.size(), 'x');
  EXPECT_STREQ(error.HandOutText(), "a text that is longer than any small-string buffer");
}

TEST(ErrorStateTest, CanRepeatItsOwnText) {
  ErrorState error;
  error.Set(-1, "text");
  error.Set(-3, error.HandOutText());
  EXPECT_STREQ(error.HandOutText(), "text");
}

TEST(ErrorStateTest, AHandedOutTextOutlivesAnyNumberOfErrors) {
  ErrorState error;
  const std::string text = "the text that a host thread is still reading";
  error.Set(-1, text.c_str());
  const char* const held = error.HandOutText();
  for (int i = 0; i < 1000; ++i) {
    error.Set(
        -3, ("another text, also too long for a small-string buffer " + std::to_string(i)).c_str());
  }
  EXPECT_EQ(held, text);
}

TEST(ErrorStateTest, AHandedOutTextOutlivesFifteenOthers) {
  ErrorState error;
  const std::string text = "the text that a host thread is still reading";
  error.Set(-1, text.c_str());
  const char* const held = error.HandOutText();
  for (int i = 0; i < 15; ++i) {
    const std::string other =
        "another text, also too long for a small-string buffer " + std::to_string(i);
    error.Set(-3, other.c_str());
    EXPECT_EQ(error.HandOutText(), other);
    EXPECT_EQ(held, text) << i;
  }
}

TEST(ErrorStateTest, HandsOutOneTextWhileNothingChanges) {
  ErrorState error;
  error.Set(-1, "text");
  EXPECT_EQ(error.HandOutText(), error.HandOutText());
}

TEST(ErrorStateTest, WithoutMemoryToHandATextOutItSaysSo) {
  ErrorState error;
  const std::string longText(200, 'x');
  error.Set(-9, longText.c_str());
  {
    const FailingNew noMemory(1);
    EXPECT_STREQ(error.HandOutText(), "Out of memory");
  }
  EXPECT_EQ(error.HandOutText(), longText);
}

TEST(ErrorStateTest, WithoutMemoryForTheTextItSaysSo) {
  ErrorState error;
  const std::string longText(200, 'x');
  {
    const FailingNew noMemory(1);
    error.Set(-9, longText.c_str());
  }
  EXPECT_EQ(error.Code(), -9);
  EXPECT_STREQ(error.HandOutText(), "Out of memory");
}

TEST(ErrorStateTest, TextsOfManyThreadsStayWhole) {
  ErrorState error;
  std::vector<std::thread> threads;
  for (int number = 0; number < 4; ++number) {
    threads.emplace_back([&error, number] {
      const std::string text(100, static_cast<char>('a' + number));
      for (int i = 0; i < 500; ++i) error.Set(-1, text.c_str());
    });
  }
  for (std::thread& thread : threads) thread.join();
  const std::string text = error.Text();
  EXPECT_EQ(text, std::string(100, text.empty() ? '?' : text[0]));
}
