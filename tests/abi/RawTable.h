// SPDX-License-Identifier: Apache-2.0
#pragma once

// Calls by slot number, as a host does that was compiled against headers of its own: an object
// starts with the pointer to its table, and the object is the first argument.
using Slot = void (*)();

// The type of the called function is not known here on purpose, so it cannot be compared either.
#if defined(__clang__)
#define LOKA_UNTYPED_CALL __attribute__((no_sanitize("function")))
#else
#define LOKA_UNTYPED_CALL
#endif

template <class Result, class... Arguments>
LOKA_UNTYPED_CALL Result CallSlot(void* object, int slot, Arguments... arguments) {
  Slot* const table = *static_cast<Slot**>(object);
  return reinterpret_cast<Result (*)(void*, Arguments...)>(table[slot])(object, arguments...);
}
