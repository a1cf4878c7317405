// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "driver/Tag_LOKA.h"

// A tag of the driver at a place that no URI can name: an element, and an item or bit within it.
class PlacedTag : public Tag_LOKA {
 public:
  PlacedTag(const char* uri, const Protocol_LOKA& protocol, int index, int subIndex)
      : Tag_LOKA(uri, protocol) {
    index_ = index;
    subIndex_ = subIndex;
  }
};
