// SPDX-License-Identifier: Apache-2.0
#include "driver/Tag_LOKA.h"

#include <vector>

#include "driver/ParamManager.h"
#include "driver/Protocol_LOKA.h"
#include "driver/Texts_LOKA.h"
#include "model/MemoryManager.h"
#include "protlib/NoThrow.h"
#include "protlib/ParseInt.h"
#include "protlib/ProtUtilsN.h"

namespace {

constexpr std::size_t kUriFields = 3;

}  // namespace

Tag_LOKA::Tag_LOKA(const char* uri, const Protocol_LOKA& protocol)
    : uri_(uri == nullptr ? "" : uri) {
  valid_ = parseTagUrl(protocol);
}

ITag* Tag_LOKA::Clone() const {
  return NoThrow(static_cast<ITag*>(nullptr), [this]() -> ITag* { return new Tag_LOKA(*this); });
}

bool Tag_LOKA::Fail(const char* text) const {
  SetError(text);
  return false;
}

bool Tag_LOKA::parseTagUrl(const Protocol_LOKA& protocol) {
  std::vector<std::string> fields;
  ProtUtilsN::ParseSubstrings(uri_, fields, '?');
  if (fields.size() != kUriFields) {
    return Fail(Texts_LOKA::kNotThreeFields);
  }
  const std::string& node = fields[0];
  const std::string& memoryType = fields[1];
  const std::string& dataType = fields[2];
  if (memoryType.empty()) {
    return Fail(Texts_LOKA::kNoMemoryTypeField);
  }
  if (dataType.empty()) {
    return Fail(Texts_LOKA::kNoDataTypeField);
  }
  nodeId_ = ParseInt(node.c_str(), 0);
  return FindMemory(protocol, memoryType) && CheckDataType(dataType);
}

bool Tag_LOKA::FindMemory(const Protocol_LOKA& protocol, const std::string& memoryType) {
  commonParams_ = protocol.Params().getCommonParams();
  if (commonParams_ == nullptr) {
    return Fail(Texts_LOKA::kNoCommonParams);
  }
  nodeParams_ = protocol.Params().getNodeParams(nodeId_);
  if (nodeParams_ == nullptr) {
    return Fail(Texts_LOKA::kNoNodeParams);
  }
  model_ = protocol.Memory().getModel(nodeParams_->model);
  if (model_ == nullptr) {
    return Fail(Texts_LOKA::kNoModel);
  }
  // Without the fallback to the first model: a node of an unknown model ends here.
  memoryType_ = protocol.Memory().getMemoryType(nodeParams_->model, memoryType);
  const MemoryTypeRow* row = FindMemoryType(memoryType);
  if (memoryType_ == nullptr || row == nullptr) {
    return Fail(Texts_LOKA::kNoMemoryType);
  }
  id_ = row->id;
  isSerialParam_ = row->isSerialParam;
  return true;
}

bool Tag_LOKA::CheckDataType(const std::string& dataType) {
  if (!ProtUtilsN::GetVADOType(dataType, varType_, itemType_, varLength_, conversions_)) {
    return Fail((dataType + Texts_LOKA::kUnknownDataType).c_str());
  }
  const auto allowed = static_cast<unsigned int>(memoryType_->getVadoTypes());
  if ((ProtUtilsN::GetTypeFlag(varType_) & allowed) == 0) {
    return Fail(Texts_LOKA::kDataTypeNotAllowed);
  }
  if (ProtUtilsN::GetDataLength(memoryType_->getNaturalType()) == 0) {
    return Fail(Texts_LOKA::kBadNaturalType);
  }
  return true;
}

bool Tag_LOKA::IsReadOnly() const { return memoryType_ != nullptr && memoryType_->isReadOnly(); }

bool Tag_LOKA::IsWriteOnly() const { return memoryType_ != nullptr && memoryType_->isWriteOnly(); }

unsigned int Tag_LOKA::GetByteOffset() const {
  const ICU_Type naturalType = memoryType_->getNaturalType();
  if (!ProtUtilsN::IsBitType(varType_)) {
    return static_cast<unsigned int>(subIndex_ * ProtUtilsN::GetBasicLength(this) +
                                     ProtUtilsN::GetDataLength(naturalType) * index_);
  }
  if (!ProtUtilsN::IsBitType(naturalType)) {
    return static_cast<unsigned int>(subIndex_ / 8 +
                                     ProtUtilsN::GetDataLength(naturalType) * index_);
  }
  return static_cast<unsigned int>(index_ / 8);
}

int Tag_LOKA::GetBitIndex() const {
  return (ProtUtilsN::IsBitType(memoryType_->getNaturalType()) ? index_ : subIndex_) % 8;
}
