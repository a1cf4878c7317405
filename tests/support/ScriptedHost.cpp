// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ScriptedHost.h"

ScriptedHost::ScriptedHost()
    : multiTask_(log_, faults_),
      serialFactory_(log_, faults_),
      storage_(log_, faults_),
      socketFactory_("ISocketFactory"),
      cdsBuffer_("ICDSBuffer"),
      diag_("IDiag"),
      driverInterface_("IDriverInterface"),
      smux_("ISmux"),
      fastTimer_("IFastTimer"),
      services_{{"IMultiTask2", &multiTask_},
                {"ISerialFactory", &serialFactory_},
                {"ISocketFactory", &socketFactory_},
                {"ICDSBuffer", &cdsBuffer_},
                {"IDiag", &diag_},
                {"IPermanentStorage", &storage_},
                {"IDriverInterface", &driverInterface_},
                {"ISmux", &smux_},
                {"IFastTimer", &fastTimer_}} {}

IInterface* ScriptedHost::CreateInterface(const char* name) {
  const std::string asked = name != nullptr ? name : "(null)";
  const auto found = services_.find(asked);
  const bool given =
      found != services_.end() && absent_.count(asked) == 0 && !faults_.IsToFail("CreateInterface");
  log_.Add("CreateInterface " + asked + (given ? "" : " -> null"));
  if (!given) return nullptr;
  ++lent_[asked];
  return found->second;
}

void ScriptedHost::ReleaseInterface(IInterface* interface) {
  for (const auto& [name, service] : services_) {
    if (service != interface) continue;
    log_.Add("ReleaseInterface " + name);
    --lent_[name];
    return;
  }
  log_.AddViolation("ReleaseInterface of something that is no service");
}

void ScriptedHost::RunUntilSilent(const std::string& port) {
  ScriptedLine& line = Line(port);
  ScriptedTask* task = multiTask_.LastTask();
  if (task != nullptr && !task->IsEnded()) {
    task->RunUntil([&line] { return line.IsExhausted(); });
  }
}

void ScriptedHost::RunPasses(int count) {
  ScriptedTask* task = multiTask_.LastTask();
  if (task != nullptr && !task->IsEnded()) task->RunPasses(count);
}

std::string ScriptedHost::Complaints() const {
  std::string text = log_.Violations() + multiTask_.Leftovers();
  if (serialFactory_.OpenCount() != 0) text += "a port was not released\n";
  for (const auto& [name, count] : lent_) {
    if (count > 0) text += name + " was not released\n";
    if (count < 0) text += name + " was released more often than created\n";
  }
  return text;
}
