// SPDX-License-Identifier: Apache-2.0
#include "host/runtime/HostSession.h"

#include <atomic>
#include <utility>

#include "interfaces/IProtModule.h"
#include "interfaces/IProtocol.h"
#include "interfaces/IProtocolFactory.h"

namespace {

constexpr const char* kProtocolName = "LOKA";
constexpr int kEndTasksLimitMs = 2000;

// Set while a session of this process is open.
std::atomic<bool> isSessionOpen{false};

HostResult Failure(ExitStatus status, std::string text) {
  HostResult result;
  result.status = status;
  result.text = std::move(text);
  return result;
}

std::string DriverText(const IProtocol* protocol) {
  const char* const text = protocol->GetLastErrorString();
  return text == nullptr ? "" : text;
}

// The named interface of the plug-in, or null.
template <typename Interface>
Interface* Obtain(IInterfaceFactory* factory, const char* name) {
  IInterface* const object = factory->CreateInterface(name);
  return object == nullptr ? nullptr : static_cast<Interface*>(object->ConvertTo(name));
}

}  // namespace

HostSession::HostSession(HostOptions options)
    : options_(std::move(options)), serialFactory_(options_.ports, options_.observer) {}

HostSession::~HostSession() { Close(); }

bool HostSession::TakeTurn() {
  hasTurn_ = hasTurn_ || !isSessionOpen.exchange(true);
  return hasTurn_;
}

HostResult HostSession::Open() {
  if (!TakeTurn()) {
    return Failure(ExitStatus::kPlugin, "another session of this process is open");
  }
  HostResult result = OpenStorage();
  if (!result.IsDone()) {
    return result;
  }
  factory_ = std::make_unique<HostFactory>(&multiTask_, &serialFactory_, storage_.get());
  std::string error;
  plugin_ = PluginLoader::Load(PluginLoader::Candidates(options_.pluginFile), &error);
  if (plugin_ == nullptr) {
    return Failure(ExitStatus::kPlugin, error);
  }
  result = BindModule();
  if (!result.IsDone()) {
    return result;
  }
  protocol_ = protocolFactory_->CreateProtocol(kProtocolName);
  if (protocol_ == nullptr) {
    return Failure(ExitStatus::kPlugin,
                   plugin_->Path() + " has no protocol \"" + kProtocolName + "\"");
  }
  protocol_->SetIdent(options_.ident.c_str());
  return {};
}

HostResult HostSession::OpenStorage() {
  if (options_.storeFile.empty()) {
    return {};
  }
  std::string error;
  PortObserver* const observer = options_.observer;
  storage_ = SqliteStorage::Open(
      options_.storeFile,
      [observer](const std::string& text) {
        if (observer != nullptr) {
          observer->OnPortNote(text);
        }
      },
      &error);
  return storage_ == nullptr ? Failure(ExitStatus::kRefused, error) : HostResult{};
}

HostResult HostSession::BindModule() {
  IInterfaceFactory* const factory = plugin_->Factory();
  protocolFactory_ = Obtain<IProtocolFactory>(factory, "IProtocolFactory");
  if (protocolFactory_ == nullptr) {
    return Failure(ExitStatus::kPlugin, plugin_->Path() + " lacks the interface IProtocolFactory");
  }
  auto* const module = Obtain<IProtModule>(factory, "IProtModule");
  if (module == nullptr) {
    return Failure(ExitStatus::kPlugin, plugin_->Path() + " lacks the interface IProtModule");
  }
  if (module->Init(factory_.get()) == 0) {
    return Failure(ExitStatus::kPlugin, plugin_->Path() + ": " + module->GetLastError());
  }
  module_ = module;
  return {};
}

HostResult HostSession::Configure(const std::string& configuration) {
  if (protocol_->Config(configuration.c_str()) == 0) {
    return Failure(ExitStatus::kConfiguration, DriverText(protocol_));
  }
  return {};
}

HostResult HostSession::Start() {
  if (protocol_->Start() != 0) {
    return {};
  }
  HostResult result = Failure(ExitStatus::kPort, DriverText(protocol_));
  result.problem = serialFactory_.LastProblem();
  return result;
}

void HostSession::Stop() {
  if (protocol_ != nullptr) {
    (void)protocol_->Stop();
  }
}

std::unique_ptr<HostTag> HostSession::CreateTag(const std::string& uri, std::string* error) {
  ITag* const tag = protocol_->CreateTag(uri.c_str());
  if (tag == nullptr) {
    *error = DriverText(protocol_);
    return nullptr;
  }
  return std::make_unique<HostTag>(protocol_, tag, storage_.get());
}

void HostSession::Close() {
  Stop();
  // The driver gives its task one second. A wait that is longer, as a long gap makes it, is ended
  // here, since the task must not outlive the protocol.
  if (multiTask_.TaskCount() != 0) {
    serialFactory_.CancelAll();
    if (!multiTask_.EndTasks(kEndTasksLimitMs)) {
      plugin_->KeepLoaded();
      return;
    }
  }
  if (protocol_ != nullptr) {
    protocolFactory_->DeleteProtocol(protocol_);
    protocol_ = nullptr;
  }
  if (module_ != nullptr) {
    module_->Close();
    module_ = nullptr;
  }
  plugin_.reset();
  if (hasTurn_) {
    hasTurn_ = false;
    isSessionOpen.store(false);
  }
}
