// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <stdexcept>
#include <string>

#include "host/base/ExitStatus.h"
#include "host/runtime/HostEvents.h"
#include "host/runtime/HostSession.h"

// What ends a demonstration early: the host cannot be brought up or a tag refuses.
class DemoError : public std::runtime_error {
 public:
  DemoError(ExitStatus status, const std::string& text)
      : std::runtime_error(text), status_(status) {}
  ExitStatus Status() const { return status_; }

 private:
  ExitStatus status_;
};

struct DemoHostOptions {
  std::string pluginFile;
  std::string portPath;
  std::string storeFile;      // empty: no permanent storage
  std::string configuration;  // what is added to the settings that all steps share
};

// A started host at the demonstration's port. Operations throw DemoError when they cannot go on.
// One thread.
class DemoHost {
 public:
  // Milliseconds of silence that end a token, in all steps.
  static constexpr int kGapMs = 100;

  explicit DemoHost(const DemoHostOptions& options);

  // Waits until this many tokens are queued, at most 20 seconds.
  bool WaitForTokens(unsigned int count);

  // Waits until the driver has worked off this many bytes since the start.
  bool WaitForBytes(std::uint64_t count);

  // Waits until the receiver has begun anew after a silence.
  bool WaitForNewPass();

  // Tag values, by memory type.
  unsigned int Number(const std::string& memoryType, const std::string& type);
  std::string Text(const std::string& memoryType);
  void WriteNumber(const std::string& memoryType, const std::string& type, unsigned int value);
  void WriteText(const std::string& memoryType, const std::string& text);

 private:
  std::unique_ptr<HostTag> MakeTag(const std::string& memoryType, const std::string& type);

  HostEvents events_;
  HostSession session_;
};
