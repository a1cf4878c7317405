// SPDX-License-Identifier: Apache-2.0
#pragma once

// Root of every object that crosses the boundary between the host and the plug-in.
//
// The rules below hold for all headers of this folder.
//
// Layout. Classes follow the Itanium C++ ABI: the table pointer stands first, a virtual destructor
// takes two slots (complete, deleting), slots count from 0. Each operation carries its slot number
// in a comment. Slots are never removed, reordered or reused; numbered interfaces only append. This
// folder is the only place that knows slot orders: a host that orders its own tables otherwise
// needs a change here and nowhere else.
//
// Results. "int" is 32 bits. Where an `int` means yes or no, zero is no and every other value is
// yes. No operation throws.
//
// Threads. Four names are used: the *loading thread* loads the library and starts or closes the
// module; *host threads* configure protocols and read and write tags; the *console thread* passes
// text commands; the *receive task* is the one thread that a started protocol asks the host for.
//
// Pointers. A pointer may be null only where the comment says so. Text is zero-terminated and stays
// owned by the object that returns it.

static_assert(sizeof(int) == 4, "the interfaces count on a 32-bit int");
static_assert(sizeof(bool) == 1, "the interfaces count on a one-byte bool");

class IInterface {
 public:
  // slots 0, 1
  virtual ~IInterface() = default;

  // slot 2. Asks the object for one of its interfaces by exact, case-sensitive name.
  // Returns the same object as that interface, or null when it does not implement it. The caller
  // gets no ownership. Any thread.
  virtual void* ConvertTo(const char* name) = 0;
};
