// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <list>
#include <unordered_map>

#include "protlib/LeafMutex.h"

class ITag;

// The live tags of one protocol, in the order of their creation. It owns them. Host threads and the
// console thread add and remove at once, so the list is guarded; a tag is destroyed outside the
// lock.
class TagList {
 public:
  TagList() = default;
  TagList(const TagList&) = delete;
  TagList& operator=(const TagList&) = delete;
  ~TagList() { DeleteAll(); }

  // Takes ownership. Throws std::bad_alloc, and has then not taken it.
  void Append(ITag* tag);

  // Removes every entry of the tag, if any, and hands it back to the caller. Does not take longer
  // with more tags in the list.
  void Remove(ITag* tag);

  // Destroys every tag and leaves the list empty.
  void DeleteAll();

 private:
  using Entries = std::list<ITag*>;

  LeafMutex mutex_;
  Entries entries_ LOKA_GUARDED_BY(mutex_);
  std::unordered_multimap<ITag*, Entries::iterator> places_ LOKA_GUARDED_BY(mutex_);
};
