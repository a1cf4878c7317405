// SPDX-License-Identifier: Apache-2.0
#include "host/demo/DemoReport.h"

#include <cstdio>

namespace {

constexpr const char* kBold = "\033[1m";
constexpr const char* kGreen = "\033[32m";
constexpr const char* kRed = "\033[31m";
constexpr const char* kPlain = "\033[0m";

}  // namespace

std::string DemoReport::Coloured(const std::string& text, const char* code) const {
  return isColoured_ ? code + text + kPlain : text;
}

void DemoReport::Begin(const std::string& title) {
  ++stepCount_;
  hasStepFailed_ = false;
  const std::string heading = std::to_string(stepCount_) + "  " + title;
  (void)std::printf("%s\n", Coloured(heading, kBold).c_str());
}

void DemoReport::Show(const std::string& label, const std::string& value) {
  (void)std::printf("     %-24s %s\n", label.c_str(), value.c_str());
}

bool DemoReport::Expect(const std::string& label, const std::string& actual,
                        const std::string& expected) {
  if (actual == expected) {
    Show(label, actual);
    return true;
  }
  Show(label, Coloured(actual + "   expected: " + expected, kRed));
  hasStepFailed_ = true;
  return false;
}

void DemoReport::Fail(const std::string& reason) {
  Show("failed", Coloured(reason, kRed));
  hasStepFailed_ = true;
}

void DemoReport::End() {
  if (hasStepFailed_) {
    ++failedCount_;
    failedSteps_ += (failedSteps_.empty() ? "" : ", ") + std::to_string(stepCount_);
  }
  (void)std::printf("     %s\n\n", hasStepFailed_ ? Coloured("NOT as expected", kRed).c_str()
                                                  : Coloured("as expected", kGreen).c_str());
  (void)std::fflush(stdout);
}

bool DemoReport::Finish() const {
  const std::string failed = failedCount_ == 0 ? "" : "; failed: " + failedSteps_;
  (void)std::printf("demo: %d of %d steps as expected%s\n", stepCount_ - failedCount_, stepCount_,
                    failed.c_str());
  return failedCount_ == 0 && stepCount_ > 0;
}
