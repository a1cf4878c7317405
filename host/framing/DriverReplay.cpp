// SPDX-License-Identifier: Apache-2.0
#include "host/framing/DriverReplay.h"

#include <memory>
#include <utility>

#include "host/framing/ConfigEdit.h"
#include "host/framing/FramingSettings.h"
#include "host/framing/ReplayHost.h"
#include "host/runtime/HostTag.h"
#include "host/runtime/PluginLoader.h"
#include "interfaces/IProtModule.h"
#include "interfaces/IProtocol.h"
#include "interfaces/IProtocolFactory.h"

namespace {

constexpr const char* kProtocolName = "LOKA";
// A single pass may give a token a byte; the queue must not fill.
constexpr std::size_t kBytesBetweenLooks = 4096;
constexpr const char* kTokenUri = "0?rx_token?string-4096";  // two characters a byte, and room

template <typename Interface>
Interface* Obtain(IInterfaceFactory* factory, const char* name) {
  IInterface* const object = factory->CreateInterface(name);
  return object == nullptr ? nullptr : static_cast<Interface*>(object->ConvertTo(name));
}

// One protocol on the services of a ReplayHost.
class Replay {
 public:
  explicit Replay(const LineScript* script) : host_(script) {}
  ~Replay();
  Replay(const Replay&) = delete;
  Replay& operator=(const Replay&) = delete;

  ReplayResult Run(const std::string& pluginFile, const std::string& configuration);

 private:
  bool Load(const std::string& pluginFile);
  bool Configure(const std::string& configuration);
  bool MakeTags();
  void LookNowAndThen();
  void TakeTokens();
  bool Fail(ExitStatus status, const std::string& text);
  bool FailWithDriversText(ExitStatus status);

  ReplayHost host_;
  std::unique_ptr<PluginLoader> plugin_;
  IProtModule* module_ = nullptr;
  IProtocolFactory* protocols_ = nullptr;
  IProtocol* protocol_ = nullptr;
  std::unique_ptr<HostTag> available_;
  std::unique_ptr<HostTag> token_;
  std::unique_ptr<HostTag> acknowledge_;
  ReplayResult result_;
  std::size_t looks_ = 0;
};

Replay::~Replay() {
  available_.reset();
  token_.reset();
  acknowledge_.reset();
  if (protocol_ != nullptr) {
    (void)protocol_->Stop();
    protocols_->DeleteProtocol(protocol_);
  }
  if (module_ != nullptr) {
    module_->Close();
  }
}

ReplayResult Replay::Run(const std::string& pluginFile, const std::string& configuration) {
  if (Load(pluginFile) && Configure(configuration) && MakeTags()) {
    host_.MultiTask().SetBetweenPasses([this] { TakeTokens(); });
    host_.MultiTask().Semaphore().SetWhenFree([this] { LookNowAndThen(); });
    host_.Task().Run();
    TakeTokens();
  }
  return std::move(result_);
}

bool Replay::Load(const std::string& pluginFile) {
  std::string error;
  plugin_ = PluginLoader::Load(PluginLoader::Candidates(pluginFile), &error);
  if (plugin_ == nullptr) {
    return Fail(ExitStatus::kPlugin, error);
  }
  result_.pluginPath = plugin_->Path();
  protocols_ = Obtain<IProtocolFactory>(plugin_->Factory(), "IProtocolFactory");
  auto* const module = Obtain<IProtModule>(plugin_->Factory(), "IProtModule");
  if (protocols_ == nullptr || module == nullptr) {
    return Fail(ExitStatus::kPlugin, plugin_->Path() + " lacks a module or a protocol factory");
  }
  if (module->Init(&host_) == 0) {
    return Fail(ExitStatus::kPlugin, plugin_->Path() + ": " + module->GetLastError());
  }
  module_ = module;
  protocol_ = protocols_->CreateProtocol(kProtocolName);
  return protocol_ != nullptr ||
         Fail(ExitStatus::kPlugin, plugin_->Path() + " has no protocol \"" + kProtocolName + "\"");
}

// The configuration as given comes first, so that the driver's judgement of it is not hidden.
bool Replay::Configure(const std::string& configuration) {
  std::string replayed = configuration;
  if (protocol_->Config(replayed.c_str()) == 0) {
    return FailWithDriversText(ExitStatus::kConfiguration);
  }
  for (const auto& [key, value] :
       {std::pair("hex_tokens", "true"), std::pair("autoConnect", "true"),
        std::pair("token_queue_size", "10000")}) {
    replayed = WithConfigValue(replayed, key, value);
  }
  if (protocol_->Config(replayed.c_str()) == 0) {
    return FailWithDriversText(ExitStatus::kConfiguration);
  }
  return protocol_->Start() != 0 || FailWithDriversText(ExitStatus::kRefused);
}

bool Replay::MakeTags() {
  const auto make = [this](const char* uri, std::unique_ptr<HostTag>* tag) {
    ITag* const made = protocol_->CreateTag(uri);
    if (made != nullptr) {
      *tag = std::make_unique<HostTag>(protocol_, made, nullptr);
    }
    return made != nullptr;
  };
  return (make("0?tokens_available?unsignedInt", &available_) && make(kTokenUri, &token_) &&
          make("0?token_ack?boolean", &acknowledge_)) ||
         FailWithDriversText(ExitStatus::kRefused);
}

// A pass may cut more tokens than the queue holds.
void Replay::LookNowAndThen() {
  const std::size_t looks = host_.Port().BytesPlayed() / kBytesBetweenLooks;
  if (looks != looks_) {
    looks_ = looks;  // first: taking tokens holds semaphores, too
    TakeTokens();
  }
}

void Replay::TakeTokens() {
  unsigned int left = 0;
  std::string text;
  if (result_.IsDone() && !available_->ReadNumber(&left)) {
    (void)FailWithDriversText(ExitStatus::kRefused);
  }
  for (; left > 0 && result_.IsDone(); --left) {
    if (!token_->ReadText(&text) || !acknowledge_->WriteNumber(1)) {
      (void)FailWithDriversText(ExitStatus::kRefused);
      return;
    }
    result_.tokens.push_back(BytesOfHexText(text));
  }
}

bool Replay::Fail(ExitStatus status, const std::string& text) {
  result_.status = status;
  result_.text = text;
  return false;
}

bool Replay::FailWithDriversText(ExitStatus status) {
  const char* const text = protocol_->GetLastErrorString();
  return Fail(status, text == nullptr ? "" : text);
}

}  // namespace

ReplayResult ReplayThroughDriver(const std::string& pluginFile, const std::string& configuration,
                                 const LineScript& script) {
  Replay replay(&script);
  return replay.Run(pluginFile, configuration);
}
