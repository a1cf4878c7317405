// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/demo/DemoReport.h"

namespace {

// What the report prints, caught from stdout.
template <typename Print>
std::string Printed(Print print) {
  testing::internal::CaptureStdout();
  print();
  return testing::internal::GetCapturedStdout();
}

TEST(DemoReport, CountsStepsThatAreAsExpected) {
  DemoReport report(false);
  bool isDone = false;
  const std::string text = Printed([&] {
    report.Begin("first");
    EXPECT_TRUE(report.Expect("value", "1", "1"));
    report.End();
    isDone = report.Finish();
  });
  EXPECT_TRUE(isDone);
  EXPECT_NE(text.find("1  first\n"), std::string::npos) << text;
  EXPECT_NE(text.find("demo: 1 of 1 steps as expected\n"), std::string::npos) << text;
  EXPECT_EQ(text.find('\033'), std::string::npos);
}

TEST(DemoReport, NamesStepsThatAreNot) {
  DemoReport report(false);
  bool isDone = true;
  const std::string text = Printed([&] {
    report.Begin("first");
    EXPECT_FALSE(report.Expect("value", "1", "2"));
    EXPECT_TRUE(report.Expect("value", "1", "1"));
    report.End();
    report.Begin("second");
    report.End();
    report.Begin("third");
    report.Fail("no token");
    report.End();
    isDone = report.Finish();
  });
  EXPECT_FALSE(isDone);
  EXPECT_NE(text.find("1   expected: 2\n"), std::string::npos) << text;
  EXPECT_NE(text.find("demo: 1 of 3 steps as expected; failed: 1, 3\n"), std::string::npos) << text;
}

TEST(DemoReport, NothingDoneIsNoSuccess) {
  const DemoReport report(false);
  bool isDone = true;
  (void)Printed([&] { isDone = report.Finish(); });
  EXPECT_FALSE(isDone);
}

TEST(DemoReport, ColoursOnlyWhenAsked) {
  DemoReport report(true);
  const std::string text = Printed([&] {
    report.Begin("first");
    report.End();
  });
  EXPECT_NE(text.find("\033[1m1  first\033[0m"), std::string::npos) << text;
}

}  // namespace
