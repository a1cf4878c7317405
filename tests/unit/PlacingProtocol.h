// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>

#include "driver/Protocol_LOKA.h"
#include "tests/unit/PlacedTag.h"

// The driver with tags at places that no URI can name.
class PlacingProtocol : public Protocol_LOKA {
 public:
  TagBase* CreateTagBase(const char* uri) override {
    auto tag = std::make_unique<PlacedTag>(uri, *this, index, subIndex);
    return tag->IsValid() ? tag.release() : nullptr;
  }

  // Of the tags created from now on.
  int index = 0;
  int subIndex = 0;
};
