// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/base/ExitStatus.h"
#include "host/framing/LineScript.h"

// How a replay went.
struct ReplayResult {
  ExitStatus status = ExitStatus::kDone;
  std::string text;                 // why not, in the driver's own words where it has some
  std::vector<std::string> tokens;  // every byte, zero bytes included
  std::string pluginPath;

  bool IsDone() const { return status == ExitStatus::kDone; }
};

// Runs a plug-in on a line that exists in memory only: the script's bytes come without a pause, its
// silences end a receive when they last as long as the receive waits, and nothing waits for real
// time. The configuration's framing counts; its port is not opened, and tokens are taken as
// hexadecimal text so that zero bytes come through. The plug-in runs on the calling thread alone.
// `pluginFile` as for PluginLoader::Candidates. Not while a HostSession of this process is open.
ReplayResult ReplayThroughDriver(const std::string& pluginFile, const std::string& configuration,
                                 const LineScript& script);
