// SPDX-License-Identifier: Apache-2.0
#pragma once

// Calls by slot number, as a host does that was compiled against headers of its own: an object
// starts with the pointer to its table, and the object is the first argument.
using Slot = void (*)();

template <class Result, class... Arguments>
Result CallSlot(void* object, int slot, Arguments... arguments) {
  Slot* const table = *static_cast<Slot**>(object);
  return reinterpret_cast<Result (*)(void*, Arguments...)>(table[slot])(object, arguments...);
}
