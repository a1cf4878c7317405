// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>

#include "host/demo/DemoDevice.h"
#include "host/demo/DemoHost.h"
#include "host/demo/DemoReport.h"

// The steps of the demonstration: how tokens are framed, queued, sent, and how settings change
// while the driver runs. One thread.
class DemoSteps {
 public:
  DemoSteps(std::string pluginFile, std::string storeFile, DemoDevice* device, DemoReport* report);

  // Runs all of them. A step that cannot go on counts as failed; one that cannot bring up the host
  // throws DemoError.
  void RunAll();

 private:
  void Run(const std::string& title, void (DemoSteps::*step)());

  void PrefixAndSuffix();
  void PrefixOnly();
  void SuffixOnly();
  void GapOnly();
  void HexTokens();
  void QueueOverflow();
  void SentToken();
  void PartialToken();
  void StagedOverride();
  void AppliedOverride();
  void OverrideAfterRestart();

  void StartHost(const std::string& configuration, bool withStore);
  void DeviceSends(const std::string& bytes);
  void ExpectToken(const std::string& token);
  void ExpectWaiting(unsigned int count);
  void Acknowledge();

  const std::string pluginFile_;
  const std::string storeFile_;
  DemoDevice* const device_;
  DemoReport* const report_;
  std::unique_ptr<DemoHost> host_;
};

// The host that the last step starts again in a process of its own. Prints "suffix HEX" and
// "ready", then "token HEX" for the first token that comes. Returns the exit status.
int RunDemoRestarted(const std::string& pluginFile, const std::string& portPath,
                     const std::string& storeFile);
