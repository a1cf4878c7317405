// SPDX-License-Identifier: Apache-2.0
#include "protlib/ProtocolBase.h"

#include <array>

#include "interfaces/CompareInterface.h"
#include "protlib/TagBase.h"

namespace {

constexpr int kLargestUnusedGap = 0xFFFFFF;
constexpr const char* kNoEventChannel = "protocol does not support event channel";
constexpr const char* kNoAlarms = "protocol does not support alarms";
constexpr const char* kNoTrends = "protocol does not support trends";

}  // namespace

void* ProtocolBase::ConvertTo(const char* name) {
  constexpr std::array<const char*, 8> kNames = {"ProtocolBase", "IProtocol7", "IProtocol6",
                                                 "IProtocol5",   "IProtocol4", "IProtocol3",
                                                 "IProtocol2",   "IProtocol"};
  for (const char* ours : kNames) {
    if (CompareInterface(name, ours)) {
      return this;
    }
  }
  return nullptr;
}

// --- error state and identity ---

void ProtocolBase::SetError(int code, const char* text) const { error_.Set(code, text); }

void ProtocolBase::SetTagError(const TagBase* tag) const {
  const std::string text =
      std::string("Tag URI error: ") + tag->GetVarName() + " - " + tag->GetErrorText();
  SetError(kGeneralError, text.c_str());
}

void ProtocolBase::SetArgumentError() const { SetError(kGeneralError, "illegal argument"); }

void ProtocolBase::SetMemoryError() const { SetError(kGeneralError, "Out of memory"); }

int ProtocolBase::GetLastError() const { return error_.Code(); }

const char* ProtocolBase::GetLastErrorString() const { return error_.HandOutText(); }

const char* ProtocolBase::GetIdent() const { return ident_.empty() ? GetName() : ident_.c_str(); }

void ProtocolBase::SetIdent(const char* ident) {
  Guarded(false, [&] {
    ident_ = ident == nullptr ? "" : ident;
    return true;
  });
}

const char* ProtocolBase::GetNextInstanceName() const { return GetName(); }

const char* const* ProtocolBase::tagUriNames() const {
  static constexpr std::array<const char*, 1> kNoNames = {nullptr};
  return kNoNames.data();
}

// --- neutral answers ---

int ProtocolBase::Start() { return 1; }

int ProtocolBase::Stop() { return 1; }

int ProtocolBase::MaxDatagramItems(const ITag* /*tag*/) const { return 0; }

int ProtocolBase::MaxDatagramLength(const ITag* /*tag*/) const { return 0; }

bool ProtocolBase::CanCoexistInDatagram(const ITag* /*first*/, const ITag* /*second*/) const {
  return false;
}

int ProtocolBase::ReadDatagram(const ITag* const* /*tags*/, int /*count*/,
                               unsigned char* /*buffer*/) {
  return 0;
}

const char* ProtocolBase::GetXml() const { return nullptr; }

bool ProtocolBase::IsConverted() const { return false; }

int ProtocolBase::Extend(int /*code*/, void* /*data*/) { return 0; }

bool ProtocolBase::MultipleReadSupported() const { return false; }

int ProtocolBase::MultipleRead(IMultiRead* /*request*/) { return 0; }

bool ProtocolBase::MultipleWriteSupported() const { return false; }

int ProtocolBase::MultipleWrite(IMultiWrite* /*request*/) { return 0; }

bool ProtocolBase::CanReadBitBlock(const ITag* /*tag*/) const { return false; }

int ProtocolBase::ReadBitBlock(const ITag* /*tag*/, unsigned char* /*buffer*/, int /*bitCount*/) {
  return 0;
}

void* ProtocolBase::GetInterface(const char* /*name*/) { return nullptr; }

int ProtocolBase::MaxUnusedGap(const ITag* /*tag*/) const { return kLargestUnusedGap; }

bool ProtocolBase::NeedsReadBeforeWrite(const ITag* /*tag*/) const { return false; }

bool ProtocolBase::CanWriteDatagrams(const ITag* /*tag*/) const { return false; }

bool ProtocolBase::CanAddToWriteDatagram(const ITag* const* /*tags*/, int /*count*/,
                                         const ITag* /*candidate*/) const {
  return false;
}

int ProtocolBase::WriteDatagramWithStatus(const ITag* const* /*tags*/, int /*count*/,
                                          const unsigned char* /*buffer*/,
                                          idal_error_t* /*status*/) {
  return 0;
}

bool ProtocolBase::CanWriteBitBlock(const ITag* /*tag*/) const { return false; }

int ProtocolBase::WriteBitBlock(const ITag* /*tag*/, const unsigned char* /*buffer*/,
                                int /*bitCount*/) {
  return 0;
}

bool ProtocolBase::readObject(const ITag* /*tag*/, IObjectString* /*object*/) {
  SetError(kGeneralError, "read object not supported");
  return false;
}

bool ProtocolBase::writeObject(const ITag* /*tag*/, const IObjectString* /*object*/) {
  SetError(kGeneralError, "write object not supported");
  return false;
}

int ProtocolBase::vcsGetCapability() const { return 0; }

int ProtocolBase::vcsGetComParams(char* /*buffer*/, int /*sizeBytes*/) const { return 0; }

int ProtocolBase::vcsActivateInterleaved(unsigned short /*value*/) { return 0; }

IEventChannel* ProtocolBase::createEventChannel(int /*channel*/) {
  SetError(kGeneralError, kNoEventChannel);
  return nullptr;
}

IEventChannel* ProtocolBase::createEventChannel(IEventProcessor* /*processor*/) {
  SetError(kGeneralError, kNoEventChannel);
  return nullptr;
}

void ProtocolBase::deleteEventChannel(IEventChannel* /*channel*/) {}

int ProtocolBase::addEventSource(IEventChannel* /*channel*/, const char* /*source*/) {
  SetError(kGeneralError, kNoEventChannel);
  return 0;
}

int ProtocolBase::addAlarmEvents(IEventChannel* /*channel*/, IAlarm* /*alarm*/) {
  SetError(kGeneralError, kNoEventChannel);
  return 0;
}

IEvent* ProtocolBase::frontEvent(IEventChannel* /*channel*/) { return nullptr; }

void ProtocolBase::popEvent(IEventChannel* /*channel*/) {}

IAlarm* ProtocolBase::createAlarm(const char* /*name*/) {
  SetError(kGeneralError, kNoAlarms);
  return nullptr;
}

void ProtocolBase::deleteAlarm(IAlarm* /*alarm*/) {}

int ProtocolBase::listAlarms(IAlarmProcessor* /*processor*/) { return 0; }

int ProtocolBase::quitAlarm(IAlarm* /*alarm*/) { return 0; }

ITrend* ProtocolBase::createTrend(const char* /*name*/) {
  SetError(kGeneralError, kNoTrends);
  return nullptr;
}

void ProtocolBase::deleteTrend(ITrend* /*trend*/) {}

int ProtocolBase::readTrend(ITrend* /*trend*/, unsigned long long /*from*/,
                            unsigned long long /*to*/, unsigned long long& /*last*/,
                            unsigned int /*count*/, bool /*backward*/,
                            ITrendProcessor* /*processor*/) {
  return 0;
}

bool ProtocolBase::hasPlcTimestamp(const ITag* /*tag*/) { return false; }
