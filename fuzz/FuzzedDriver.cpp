// SPDX-License-Identifier: Apache-2.0
#include "fuzz/FuzzedDriver.h"

#include <algorithm>
#include <cstring>
#include <memory>

#include "fuzz/Require.h"
#include "tests/support/GuardedBuffer.h"

// The library's entry point; the driver's objects are linked in.
extern "C" IInterfaceFactory* GetInterfaceFactory();

namespace {

template <typename Interface>
Interface* Ask(const char* name) {
  IInterface* const object = GetInterfaceFactory()->CreateInterface(name);
  return static_cast<Interface*>(object->ConvertTo(name));
}

}  // namespace

FuzzedDriver::FuzzedDriver()
    : module_(Ask<IProtModule>("IProtModule")),
      protocols_(Ask<IProtocolFactory>("IProtocolFactory")) {
  host_.Log().SetRecording(false);
  Require(module_->Init(&host_) == 1, "Init fails");
  Renew();
}

FuzzedDriver::~FuzzedDriver() {
  CheckRules();
  host_.Faults().Clear();
  Require(protocol_->Stop() != 0, "Stop fails");
  protocols_->DeleteProtocol(protocol_);
  module_->Close();
  const std::string complaints = host_.Complaints();
  Require(complaints.empty(), complaints);
}

void FuzzedDriver::Renew() {
  if (protocol_ != nullptr) {
    host_.Faults().Clear();  // a task that cannot be stopped at all would outlive its protocol
    protocol_->Stop();
    protocols_->DeleteProtocol(protocol_);
  }
  IProtocol* const created = protocols_->CreateProtocol("LOKA");
  Require(created != nullptr, "CreateProtocol fails");
  protocol_ = static_cast<IProtocol7*>(created->ConvertTo("IProtocol7"));
}

std::string FuzzedDriver::Config(const std::string& more) {
  return "CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 mode=RS-232 " +
         more;
}

void FuzzedDriver::Run(const std::string& more) {
  Require(protocol_->Config(Config(more).c_str()) != 0, "Config refuses " + more);
  Require(protocol_->Start() != 0, "Start fails");
}

void FuzzedDriver::Receive(const std::string& bytes) {
  host_.Line().Feed(bytes);
  host_.RunUntilSilent();
}

FuzzedRead FuzzedDriver::Read(const ITag* tag) {
  FuzzedRead outcome;
  const int length = tag->GetVarLength();
  if (length < 0 || length > kLongestValueBytes) return outcome;
  GuardedBuffer buffer(static_cast<std::size_t>(length));
  outcome.result = protocol_->Read(tag, buffer.Data());
  Require(buffer.AreGuardsIntact(), "Read writes beside the value");
  Require(outcome.result != 0 || buffer.IsUntouched(), "a failed Read writes");
  outcome.bytes = buffer.Bytes();
  return outcome;
}

FuzzedRead FuzzedDriver::ReadBlock(const ITag* tag, int lengthBytes) {
  FuzzedRead outcome;
  if (lengthBytes > kLongestValueBytes) return outcome;
  GuardedBuffer buffer(static_cast<std::size_t>(std::max(0, lengthBytes)));
  outcome.result = protocol_->ReadBlock(tag, buffer.Data(), lengthBytes);
  Require(buffer.AreGuardsIntact(), "ReadBlock writes beside the buffer");
  Require(outcome.result != 0 || buffer.IsUntouched(), "a failed ReadBlock writes");
  Require(outcome.result == 0 || lengthBytes >= 0, "ReadBlock takes a negative length");
  outcome.bytes = buffer.Bytes();
  return outcome;
}

int FuzzedDriver::Write(const ITag* tag, const std::string& value) {
  const int length = tag->GetVarLength();
  if (length < 0 || length > kLongestValueBytes) return 0;
  // Exactly as long as the value, so that a read behind it is noticed by the sanitizer.
  const auto size = static_cast<std::size_t>(length);
  const std::unique_ptr<unsigned char[]> bytes(new unsigned char[size]());
  std::copy_n(value.begin(), std::min(size, value.size()), bytes.get());
  return protocol_->Write(tag, bytes.get());
}

FuzzedRead FuzzedDriver::Read(const std::string& uri) {
  ITag* const tag = protocol_->CreateTag(uri.c_str());
  Require(tag != nullptr, "no tag " + uri);
  FuzzedRead outcome = Read(tag);
  protocol_->FreeTag(tag);
  return outcome;
}

int FuzzedDriver::Write(const std::string& uri, const std::string& value) {
  ITag* const tag = protocol_->CreateTag(uri.c_str());
  Require(tag != nullptr, "no tag " + uri);
  const int result = Write(tag, value);
  protocol_->FreeTag(tag);
  return result;
}

int FuzzedDriver::ReadNumber(const std::string& memoryType) {
  const FuzzedRead outcome = Read("0?" + memoryType + "?unsignedInt");
  Require(outcome.result != 0, memoryType + " cannot be read");
  int value = 0;
  std::memcpy(&value, outcome.bytes.data(), sizeof value);
  return value;
}

FuzzedRead FuzzedDriver::Command(const std::string& line, int replyBytes) {
  GuardedBuffer buffer(static_cast<std::size_t>(std::max(0, replyBytes)));
  FuzzedRead outcome;
  outcome.result = protocol_->DoCommand(line.c_str(), buffer.Chars(), replyBytes) ? 1 : 0;
  Require(buffer.AreGuardsIntact(), "a reply is longer than its buffer");
  outcome.bytes = buffer.Bytes();
  return outcome;
}

void FuzzedDriver::CheckRules() {
  const std::string violations = host_.Log().Violations();
  Require(violations.empty(), violations);
  Require(!host_.MultiTask().IsAnySemaphoreHeld(), "a semaphore is left locked");
}
