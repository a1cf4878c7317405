// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

// Prints the demonstration step by step on stdout and keeps count of what was not as expected. One
// thread.
class DemoReport {
 public:
  // Colours only where they are asked for.
  explicit DemoReport(bool isColoured) : isColoured_(isColoured) {}

  // Starts a numbered step.
  void Begin(const std::string& title);

  // One line of the step: what it is about and what it is.
  void Show(const std::string& label, const std::string& value);

  // The same with a check: a value that differs from the expected one is shown with it and fails
  // the step. Returns whether it is as expected.
  bool Expect(const std::string& label, const std::string& actual, const std::string& expected);

  // Fails the step with a reason.
  void Fail(const std::string& reason);

  // Ends the step with its result.
  void End();

  // Prints the verdict over all steps. True when each was as expected and there was one.
  bool Finish() const;

 private:
  std::string Coloured(const std::string& text, const char* code) const;

  const bool isColoured_;
  int stepCount_ = 0;
  bool hasStepFailed_ = false;
  std::string failedSteps_;
  int failedCount_ = 0;
};
