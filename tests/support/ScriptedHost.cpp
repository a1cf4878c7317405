// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ScriptedHost.h"

#include "tests/support/HostCall.h"

namespace {

// Says when a line has nothing to give any more.
class LineWatch {
 public:
  explicit LineWatch(const ScriptedLine& line) : line_(line) {}

  // Asked in front of every pass. Nobody may listen any more: after a while without anything taken
  // the line counts as silent, too.
  bool IsSilent() {
    constexpr int kMostIdlePasses = 50;
    const long long progress = line_.NowMs() - line_.EventsLeft();
    idlePasses_ = progress == before_ ? idlePasses_ + 1 : 0;
    before_ = progress;
    return line_.IsExhausted() || idlePasses_ > kMostIdlePasses;
  }

 private:
  const ScriptedLine& line_;
  int idlePasses_ = 0;
  long long before_ = -1;
};

}  // namespace

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
  const HostCall inside;
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
  const HostCall inside;
  for (const auto& [name, service] : services_) {
    if (service != interface) continue;
    log_.Add("ReleaseInterface " + name);
    --lent_[name];
    return;
  }
  log_.AddViolation("ReleaseInterface of something that is no service");
}

void ScriptedHost::RunUntilSilent(const std::string& port) {
  ScriptedTask* task = multiTask_.LastTask();
  if (task == nullptr || task->IsEnded()) return;
  LineWatch watch(Line(port));
  task->RunUntil([&watch] { return watch.IsSilent(); });
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
