// SPDX-License-Identifier: Apache-2.0
#include <cstring>
#include <memory>

#include "interfaces/CompareInterface.h"
#include "protlib/ProtUtilsN.h"
#include "protlib/ProtocolBase.h"
#include "protlib/TagBase.h"

namespace {

constexpr char kFieldSeparator = '?';

}  // namespace

ITag* ProtocolBase::CreateTag(const char* uri) {
  return Guarded(static_cast<ITag*>(nullptr), [&]() -> ITag* {
    std::unique_ptr<TagBase> tag(CreateTagBase(uri));
    if (tag == nullptr) {
      return nullptr;
    }
    tags_.Append(tag.get());
    return tag.release();
  });
}

void ProtocolBase::FreeTag(ITag* tag) {
  if (tag == nullptr) {
    return;
  }
  // Also for a tag that this driver did not make: the host hands it over to be destroyed.
  const std::unique_ptr<ITag> owner(tag);
  tags_.Remove(tag);
}

void ProtocolBase::DeleteTags() { tags_.DeleteAll(); }

bool ProtocolBase::CanAddToDatagram(const ITag* const* tags, int count, const ITag* candidate) {
  if (tags == nullptr || candidate == nullptr || count < 1) {
    return false;
  }
  if (!CanCoexistInDatagram(tags[0], candidate) || count >= MaxDatagramItems(candidate)) {
    return false;
  }
  long long lengthBytes = candidate->PackedLen();
  for (int i = 0; i < count; ++i) {
    lengthBytes += tags[i]->PackedLen();
  }
  return lengthBytes <= MaxDatagramLength(candidate);
}

bool ProtocolBase::IsBefore(const ITag* a, const ITag* b) const {
  return a != nullptr && b != nullptr && a->GetByteOffset() < b->GetByteOffset();
}

bool ProtocolBase::IsAdjacent(const ITag* a, const ITag* b) const {
  return a != nullptr && b != nullptr &&
         ProtUtilsN::getEndingBit(b) == ProtUtilsN::getStartingBit(a);
}

int ProtocolBase::getTagUriFieldCount() const {
  int count = 0;
  for (const char* const* name = tagUriNames(); *name != nullptr; ++name) {
    ++count;
  }
  return count;
}

const char* ProtocolBase::getTagUriFieldName(int index) const {
  return index >= 0 && index < getTagUriFieldCount() ? tagUriNames()[index] : nullptr;
}

int ProtocolBase::getTagUriFieldPosition(const char* name) const {
  int position = 0;
  for (const char* const* ours = tagUriNames(); *ours != nullptr; ++ours) {
    if (CompareInterface(*ours, name)) {
      return position;
    }
    ++position;
  }
  return -1;
}

const char* ProtocolBase::getTagUriField(const ITag* tag, int index, int* length) const {
  const char* begin = tag == nullptr ? nullptr : tag->GetVarName();
  for (int field = 0; begin != nullptr; ++field) {
    const char* end = std::strchr(begin, kFieldSeparator);
    if (field == index) {
      if (length != nullptr) {
        *length = static_cast<int>(end == nullptr ? std::strlen(begin)
                                                  : static_cast<std::size_t>(end - begin));
      }
      return begin;
    }
    begin = end == nullptr ? nullptr : end + 1;
  }
  return nullptr;
}
