// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <cstdint>
#include <string_view>
#include <vector>

// What every reader under measurement does beside reading: it says when its port works, counts
// tokens and bytes, keeps the arrival time of each where that is asked for, and at the last token
// tells what the run has cost its process.
//
// Command line: DEVICE STAMPS PROGRESS [more]. STAMPS is a file that gets, as 64-bit numbers, the
// number in a token's first eight characters (hexadecimal) and its arrival in nanoseconds of
// CLOCK_MONOTONIC. PROGRESS is a file of eight bytes that holds the count of tokens taken, so that
// a device can keep the tokens on their way below what a queue holds. "-" stands for neither. A
// token that begins with "Z" is the last one.
class ReaderReport {
 public:
  // Ends the process on a wrong command line.
  ReaderReport(int argumentCount, char** arguments);
  ~ReaderReport();
  ReaderReport(const ReaderReport&) = delete;
  ReaderReport& operator=(const ReaderReport&) = delete;

  const char* Device() const { return device_; }

  // The port works: prints "ready"; costs count from here.
  void Ready();

  // Takes one token. False when it was the last one; the report is then printed.
  bool OnToken(std::string_view token) {
    if (!token.empty() && token.front() == 'Z') {
      Finish();
      return false;
    }
    ++tokens_;
    bytes_ += token.size();
    if (isStamping_) {
      Stamp(token);
    }
    progress_->store(tokens_, std::memory_order_relaxed);
    return true;
  }

 private:
  void Stamp(std::string_view token);
  void Finish();

  const char* device_;
  const char* stampFile_;
  bool isStamping_;
  std::vector<std::uint64_t> stamps_;
  std::atomic<std::uint64_t> ownProgress_{0};
  std::atomic<std::uint64_t>* progress_ = &ownProgress_;
  std::uint64_t tokens_ = 0;
  std::uint64_t bytes_ = 0;
  std::int64_t startCpuNs_ = 0;
  long startVoluntary_ = 0;
  long startInvoluntary_ = 0;
};

// A token of a frame 02 ... 03, given with or without the 02 in front of it.
inline std::string_view WithoutPrefix(std::string_view frame) {
  return !frame.empty() && frame.front() == '\x02' ? frame.substr(1) : frame;
}
