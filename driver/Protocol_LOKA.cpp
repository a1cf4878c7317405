// SPDX-License-Identifier: Apache-2.0
#include "driver/Protocol_LOKA.h"

#include <array>
#include <cstring>
#include <memory>

#include "driver/CreateProtocol_LOKA.h"
#include "driver/MemoryTypeCatalogue.h"
#include "driver/Tag_LOKA.h"
#include "driver/Xml_LOKA.h"
#include "interfaces/CompareInterface.h"
#include "interfaces/IMultiTask2.h"
#include "protlib/BoundedCopy.h"
#include "protlib/HostInterfaces.h"
#include "protlib/ProtUtilsN.h"

namespace {

const Tag_LOKA& AsOurs(const ITag* tag) { return *static_cast<const Tag_LOKA*>(tag); }

}  // namespace

IProtocol* CreateProtocol_LOKA() { return std::make_unique<Protocol_LOKA>().release(); }

Protocol_LOKA::Protocol_LOKA()
    : multiTask_(piMultiTask), link_(piSerialFactory), taskRunner_(piMultiTask, *this) {
  memory_.addModel(BuildModel());
  if (multiTask_ != nullptr) {
    queueSemaphore_ = multiTask_->CreateSemaphore(0);
    portSemaphore_ = multiTask_->CreateSemaphore(0);
  }
}

Protocol_LOKA::~Protocol_LOKA() {
  link_.Disconnect();
  taskRunner_.Finish();
  for (ISemaphore* semaphore : {queueSemaphore_, portSemaphore_}) {
    if (semaphore != nullptr) {
      multiTask_->DeleteSemaphore(semaphore);
    }
  }
  link_.Close();
}

// --- identity ---

void* Protocol_LOKA::ConvertTo(const char* name) {
  return CompareInterface(name, "Protocol_LOKA") ? this : ProtocolBase::ConvertTo(name);
}

const char* Protocol_LOKA::GetImpName() const { return "Protocol_LOKA"; }

int Protocol_LOKA::GetImpVersion() const { return 100; }

const char* Protocol_LOKA::GetName() const { return "LOKA"; }

const char* Protocol_LOKA::GetProtocolName() const { return "Loka Serial"; }

int Protocol_LOKA::GetProtocolVersion() const { return 111; }

int Protocol_LOKA::GetProtocolType() const { return 471; }

int Protocol_LOKA::GetMaxTm(const ITag* /*tag*/) const { return 0; }

const char* const* Protocol_LOKA::tagUriNames() const {
  static constexpr std::array<const char*, 4> kNames = {"node", "memorytype", "datatype", nullptr};
  return kNames.data();
}

const char* Protocol_LOKA::GetXml() const { return GetXml_LOKA(); }

int Protocol_LOKA::vcsGetCapability() const { return 2; }

int Protocol_LOKA::vcsGetComParams(char* buffer, int sizeBytes) const {
  if (buffer == nullptr) {
    return 0;
  }
  if (sizeBytes < 0) {
    SetArgumentError();
    return 0;
  }
  return Guarded(0, [&] {
    const SerialSettings serial = settings_.Serial();
    const std::string text = portName_ + "," + std::to_string(serial.baudrate) + "," +
                             ParityName(serial.parity) + "," + std::to_string(serial.dataBits) +
                             "," + std::to_string(serial.stopBits) + "," + ModeName(serial.mode);
    BoundedCopy(buffer, text.c_str(), sizeBytes);
    return 1;
  });
}

int Protocol_LOKA::Extend(int code, void* data) {
  // Codes and records are the host's: 0 asks for four flags by kind, 3 for one byte of a record.
  constexpr int kFlagsByKind = 0;
  constexpr int kRecordByte = 3;
  constexpr std::size_t kRecordByteOffset = 68;
  if (code != kFlagsByKind && code != kRecordByte) {
    return 0;
  }
  if (data == nullptr) {
    SetArgumentError();
    return 0;
  }
  auto* record = static_cast<unsigned char*>(data);
  if (code == kRecordByte) {
    return record[kRecordByteOffset];
  }
  constexpr int kKindWithFirstFlag = 3;
  int kind = 0;
  std::memcpy(&kind, record, sizeof kind);
  const std::array<unsigned char, 4> flags = {
      static_cast<unsigned char>(kind == kKindWithFirstFlag ? 1 : 0), 0, 0, 0};
  std::memcpy(record + sizeof kind, flags.data(), flags.size());
  return 1;
}

// --- tags ---

TagBase* Protocol_LOKA::CreateTagBase(const char* uri) {
  auto tag = std::make_unique<Tag_LOKA>(uri, *this);
  if (!tag->IsValid()) {
    SetTagError(tag.get());
    return nullptr;
  }
  return tag.release();
}

int Protocol_LOKA::GetNodeID(const ITag* tag) const {
  return tag == nullptr ? 0 : AsOurs(tag).NodeId();
}

bool Protocol_LOKA::CanBeOptimized(const ITag* first, const ITag* second, bool forWrite) const {
  if (first == nullptr || second == nullptr || forWrite) {
    return false;
  }
  const Tag_LOKA& a = AsOurs(first);
  const Tag_LOKA& b = AsOurs(second);
  if (a.NodeId() != b.NodeId() || a.Id() != b.Id() || b.Index() < a.Index()) {
    return false;
  }
  const MemoryType& memoryType = b.GetMemoryType();
  const int itemBytes = ProtUtilsN::GetDataLength(memoryType.getNaturalType());
  const long long items = ProtUtilsN::IsBitType(memoryType.getNaturalType())
                              ? b.GetVarLength()
                              : (static_cast<long long>(b.PackedLen()) + itemBytes - 1) / itemBytes;
  return memoryType.getBlockReadCount() >= b.Index() + items - a.Index();
}
