// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/runtime/HostSession.h"

// What the command line says about the protocol instance that a command runs.
struct InstanceOptions {
  std::vector<std::string> portWords;  // --port, as given
  std::string configuration;
  std::string pluginFile;
  std::string storeFile;  // empty: the default file
  bool withoutStore = false;
  std::string ident;  // empty: the configured port name

  // The port name of the configuration, empty when it has none.
  std::string PortName() const;
};

// All three: loading thread.

// Fills in what a session needs; the observer is left alone. False, with the reason in `error`, for
// port words that are not right and for a store without a place.
bool MakeHostOptions(const InstanceOptions& options, HostOptions* host, std::string* error);

// Tells on standard error which files a session uses that was opened.
void TellFiles(const HostSession& session, const HostOptions& host);

// Tells on standard error why a step failed and what can be done about it. Returns the exit status
// of the program.
int TellFailure(const InstanceOptions& options, const HostResult& result);

// Tells on standard error what a started session runs with, stored settings included.
void TellSettings(const InstanceOptions& options, const HostOptions& host, HostSession* session);
