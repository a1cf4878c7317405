// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <set>
#include <string>

#include "interfaces/ICDSBuffer.h"
#include "interfaces/IDiag.h"
#include "interfaces/IDriverInterface.h"
#include "interfaces/IFastTimer.h"
#include "interfaces/IInterfaceFactory.h"
#include "interfaces/ISmux.h"
#include "interfaces/ISocketFactory.h"
#include "tests/support/CallLog.h"
#include "tests/support/FaultPlan.h"
#include "tests/support/ScriptedMultiTask.h"
#include "tests/support/ScriptedSerialFactory.h"
#include "tests/support/ScriptedService.h"
#include "tests/support/ScriptedStorage.h"

// A host in memory: every service that the plug-in can ask for, on lines that play a script. Every
// call is recorded in Log(); each service can be made absent, and calls can be made to fail.
class ScriptedHost final : public IInterfaceFactory {
 public:
  ScriptedHost();
  virtual ~ScriptedHost() = default;
  ScriptedHost(const ScriptedHost&) = delete;
  ScriptedHost& operator=(const ScriptedHost&) = delete;

  IInterface* CreateInterface(const char* name) override;
  void ReleaseInterface(IInterface* interface) override;

  CallLog& Log() { return log_; }
  FaultPlan& Faults() { return faults_; }
  ScriptedMultiTask& MultiTask() { return multiTask_; }
  ScriptedSerialFactory& SerialFactory() { return serialFactory_; }
  ScriptedStorage& Storage() { return storage_; }
  ScriptedLine& Line(const std::string& port = "com1") { return serialFactory_.Line(port); }

  void SetAbsent(const std::string& service) { absent_.insert(service); }
  void SetPresent(const std::string& service) { absent_.erase(service); }

  // Manual host: runs the receive task on this thread until the line's script is used up, or until
  // nobody has taken anything of it for a while. Without a task, or once it has been stopped,
  // nothing runs.
  void RunUntilSilent(const std::string& port = "com1");
  void RunPasses(int count);

  // Everything that should be given back but is not, and every broken rule. Empty when all is well.
  std::string Complaints() const;

 private:
  CallLog log_;
  FaultPlan faults_;
  ScriptedMultiTask multiTask_;
  ScriptedSerialFactory serialFactory_;
  ScriptedStorage storage_;
  ScriptedService<ISocketFactory> socketFactory_;
  ScriptedService<ICDSBuffer> cdsBuffer_;
  ScriptedService<IDiag> diag_;
  ScriptedService<IDriverInterface> driverInterface_;
  ScriptedService<ISmux> smux_;
  ScriptedService<IFastTimer> fastTimer_;
  std::map<std::string, IInterface*> services_;
  std::map<std::string, int> lent_;
  std::set<std::string> absent_;
};
