// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>

#include "host/base/ExitStatus.h"
#include "host/port/PortMap.h"
#include "host/port/PortProblem.h"
#include "host/port/PosixSerialFactory.h"
#include "host/runtime/HostFactory.h"
#include "host/runtime/HostTag.h"
#include "host/runtime/PluginLoader.h"
#include "host/runtime/PosixMultiTask.h"
#include "host/store/SqliteStorage.h"

class IProtModule;
class IProtocol;
class IProtocolFactory;
class PortObserver;

// What a session needs to know.
struct HostOptions {
  std::string pluginFile;  // as on the command line; empty searches
  PortMap ports;
  std::string storeFile;             // empty: no permanent storage
  std::string ident = "LOKA";        // the instance's key space in the storage
  PortObserver* observer = nullptr;  // may be null; must outlive the session
};

// How a step of a session went.
struct HostResult {
  ExitStatus status = ExitStatus::kDone;
  std::string text;     // why not, in the driver's own words where it has some
  PortProblem problem;  // for kPort

  bool IsDone() const { return status == ExitStatus::kDone; }
};

// The whole host around one protocol instance, from loading the plug-in to unloading it, taken down
// in the opposite order. Called on one thread; tags may be used on others. One session a process is
// open at a time: a plug-in's module keeps the services of the first host that binds it.
class HostSession {
 public:
  explicit HostSession(HostOptions options);
  ~HostSession();

  HostSession(const HostSession&) = delete;
  HostSession& operator=(const HostSession&) = delete;

  // Opens the storage, loads the plug-in, binds its module to the host's services, creates the
  // protocol and gives it its identifier.
  HostResult Open();

  // Hands the configuration to the driver.
  HostResult Configure(const std::string& configuration);

  // Starts receiving. A port that cannot be opened is explained in `problem`.
  HostResult Start();

  // Stops receiving and closes the port. Harmless when not started.
  void Stop();

  // Makes a tag; null with the driver's text in `error`. It must not outlive the session.
  std::unique_ptr<HostTag> CreateTag(const std::string& uri, std::string* error);

  // After a successful Open.
  IProtocol* Protocol() const { return protocol_; }
  const std::string& PluginPath() const { return plugin_->Path(); }

  // Null without permanent storage.
  SqliteStorage* Storage() const { return storage_.get(); }
  const std::string& Ident() const { return options_.ident; }

  // Empty without permanent storage.
  const std::string& StoreFile() const { return options_.storeFile; }

  // The path behind a port name; empty when there is none.
  std::string PathOf(const std::string& portName) const { return options_.ports.PathFor(portName); }

  // The counts of the configured port, and whether it is lost for good (see PosixSerialFactory).
  PortCounters CountersFor(const std::string& portName) const {
    return serialFactory_.CountersFor(portName);
  }
  bool IsPortGone(const std::string& portName) const { return serialFactory_.IsGone(portName); }

  // The levels of the configured port's modem lines (see PosixSerialFactory).
  ModemLines LinesOf(const std::string& portName) const { return serialFactory_.LinesOf(portName); }

  // Why a port could not be opened or set up the last time (see PosixSerialFactory::LastProblem).
  PortProblem LastPortProblem() const { return serialFactory_.LastProblem(); }

 private:
  bool TakeTurn();
  HostResult OpenStorage();
  HostResult BindModule();
  void Close();

  HostOptions options_;
  bool hasTurn_ = false;
  PosixMultiTask multiTask_;
  PosixSerialFactory serialFactory_;
  std::unique_ptr<SqliteStorage> storage_;
  std::unique_ptr<HostFactory> factory_;
  std::unique_ptr<PluginLoader> plugin_;
  IProtModule* module_ = nullptr;  // set while the module is bound
  IProtocolFactory* protocolFactory_ = nullptr;
  IProtocol* protocol_ = nullptr;
};
