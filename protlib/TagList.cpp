// SPDX-License-Identifier: Apache-2.0
#include "protlib/TagList.h"

#include <memory>

#include "interfaces/ITag.h"

void TagList::Append(ITag* tag) {
  Entries entry{tag};
  const LeafLock lock(mutex_);
  places_.emplace(tag, entry.begin());
  entries_.splice(entries_.end(), entry);
}

void TagList::Remove(ITag* tag) {
  const LeafLock lock(mutex_);
  const auto places = places_.equal_range(tag);
  for (auto place = places.first; place != places.second; ++place) {
    entries_.erase(place->second);
  }
  places_.erase(places.first, places.second);
}

void TagList::DeleteAll() {
  Entries entries;
  {
    const LeafLock lock(mutex_);
    entries.swap(entries_);
    places_.clear();
  }
  for (ITag* tag : entries) {
    const std::unique_ptr<ITag> owner(tag);
  }
}
