// SPDX-License-Identifier: Apache-2.0
#include "host/demo/DemoHost.h"

#include "host/base/Deadline.h"
#include "host/demo/DemoLimit.h"

namespace {

// Long enough for every text of the demonstration.
constexpr const char* kTextType = "string-64";

HostOptions MakeHostOptions(const DemoHostOptions& options, PortObserver* observer) {
  HostOptions host;
  host.pluginFile = options.pluginFile;
  host.storeFile = options.storeFile;
  host.ident = "demo";
  host.observer = observer;
  std::string error;
  if (!host.ports.Add("com1=" + options.portPath, &error)) {
    throw DemoError(ExitStatus::kPort, error);
  }
  return host;
}

std::string FullConfiguration(const std::string& framing) {
  return "CfgVer=1 model=1 port=com1 baudrate=115200 parity=none bits=8 stopbits=1 mode=RS-232 "
         "gap=" +
         std::to_string(DemoHost::kGapMs) + " " + framing;
}

void ThrowUnlessDone(const HostResult& result) {
  if (!result.IsDone()) {
    const std::string detail = result.problem.text.empty() ? "" : " (" + result.problem.text + ")";
    throw DemoError(result.status, result.text + detail);
  }
}

}  // namespace

DemoHost::DemoHost(const DemoHostOptions& options)
    : events_(nullptr), session_(MakeHostOptions(options, &events_)) {
  ThrowUnlessDone(session_.Open());
  ThrowUnlessDone(session_.Configure(FullConfiguration(options.configuration)));
  ThrowUnlessDone(session_.Start());
}

bool DemoHost::WaitForTokens(unsigned int count) {
  return events_.WaitUntil([&] { return Number("tokens_available", "unsignedInt") >= count; },
                           Deadline::After(kDemoLimitMs));
}

bool DemoHost::WaitForBytes(std::uint64_t count) {
  return events_.WaitUntil([&] { return events_.Progress().receivedBytes >= count; },
                           Deadline::After(kDemoLimitMs));
}

bool DemoHost::WaitForNewPass() {
  // The first silence may have ended already, in a pass that began with the former settings.
  return events_.WaitForSilences(2, Deadline::After(kDemoLimitMs));
}

std::unique_ptr<HostTag> DemoHost::MakeTag(const std::string& memoryType, const std::string& type) {
  std::string error;
  std::unique_ptr<HostTag> tag = session_.CreateTag("0?" + memoryType + "?" + type, &error);
  if (tag == nullptr) {
    throw DemoError(ExitStatus::kRefused, error);
  }
  return tag;
}

unsigned int DemoHost::Number(const std::string& memoryType, const std::string& type) {
  const std::unique_ptr<HostTag> tag = MakeTag(memoryType, type);
  unsigned int value = 0;
  if (!tag->ReadNumber(&value)) {
    throw DemoError(ExitStatus::kRefused, memoryType + ": " + tag->Error());
  }
  return value;
}

std::string DemoHost::Text(const std::string& memoryType) {
  const std::unique_ptr<HostTag> tag = MakeTag(memoryType, kTextType);
  std::string text;
  if (!tag->ReadText(&text)) {
    throw DemoError(ExitStatus::kRefused, memoryType + ": " + tag->Error());
  }
  return text;
}

void DemoHost::WriteNumber(const std::string& memoryType, const std::string& type,
                           unsigned int value) {
  const std::unique_ptr<HostTag> tag = MakeTag(memoryType, type);
  if (!tag->WriteNumber(value)) {
    throw DemoError(ExitStatus::kRefused, memoryType + ": " + tag->Error());
  }
}

void DemoHost::WriteText(const std::string& memoryType, const std::string& text) {
  const std::unique_ptr<HostTag> tag = MakeTag(memoryType, kTextType);
  if (!tag->WriteText(text)) {
    throw DemoError(ExitStatus::kRefused, memoryType + ": " + tag->Error());
  }
}
