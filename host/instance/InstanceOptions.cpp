// SPDX-License-Identifier: Apache-2.0
#include "host/instance/InstanceOptions.h"

#include "host/framing/ConfigText.h"
#include "host/instance/SettingsReport.h"
#include "host/port/PortAdvice.h"
#include "host/store/StorePath.h"
#include "host/text/ByteText.h"
#include "host/text/Output.h"

std::string InstanceOptions::PortName() const { return ConfigValue(configuration, "port", ""); }

bool MakeHostOptions(const InstanceOptions& options, HostOptions* host, std::string* error) {
  for (const std::string& word : options.portWords) {
    std::string reason;
    if (!host->ports.Add(word, &reason)) {
      error->assign("port ").append(word).append(": ").append(reason);
      return false;
    }
  }
  host->pluginFile = options.pluginFile;
  // A program without a store goes on without one, unless a file is asked for.
  if (!options.withoutStore && (SqliteFile::IsBuiltIn() || !options.storeFile.empty())) {
    host->storeFile = options.storeFile.empty() ? DefaultStorePath() : options.storeFile;
    if (host->storeFile.empty()) {
      *error = "no home folder for the store; name one with --store FILE or use --no-store";
      return false;
    }
  }
  host->ident = options.ident.empty() ? options.PortName() : options.ident;
  return true;
}

void TellFiles(const HostSession& session, const HostOptions& host) {
  TellUser("plug-in " + session.PluginPath());
  TellUser("store " + (host.storeFile.empty() ? "none" : host.storeFile) + ", identifier " +
           host.ident);
}

int TellFailure(const InstanceOptions& options, const HostResult& result) {
  TellUser(result.text);
  if (result.status == ExitStatus::kPort) {
    for (const std::string& line : AdviceFor(result.problem)) {
      TellUser(line);
    }
  } else if (result.status == ExitStatus::kConfiguration) {
    TellUser("the driver rejects the configuration: " + EscapeBytes(options.configuration));
  } else if (result.status == ExitStatus::kRefused && !options.withoutStore) {
    TellUser("--no-store goes on without stored settings");
  }
  return static_cast<int>(result.status);
}

void TellSettings(const InstanceOptions& options, const HostOptions& host, HostSession* session) {
  const std::string portName = options.PortName();
  for (const std::string& line :
       DescribeSettings(session, portName, host.ports.PathFor(portName))) {
    TellUser(line);
  }
  if (session->Storage() != nullptr) {
    const SqliteFile::Values stored = session->Storage()->All(session->Ident());
    for (const std::string& line : DescribeOverrides(options.configuration, stored)) {
      TellUser(line);
    }
  }
}
