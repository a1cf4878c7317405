// SPDX-License-Identifier: Apache-2.0
#include "protlib/LockOrder.h"

#ifndef NDEBUG

#include <array>
#include <cstdio>
#include <cstdlib>

namespace LockOrder {

namespace {

constexpr std::array<const char*, 5> kNames = {"life lock", "queue semaphore", "port semaphore",
                                               "port use", "leaf lock"};

// How often the calling thread holds a lock of each rank.
thread_local std::array<int, kNames.size()> held = {};

std::size_t IndexOf(LockRank rank) { return static_cast<std::size_t>(rank); }

}  // namespace

void Check(LockRank rank) {
  for (std::size_t other = IndexOf(rank); other < held.size(); ++other) {
    if (held[other] != 0) {
      static_cast<void>(std::fprintf(stderr, "lock order: %s taken behind %s\n",
                                     kNames[IndexOf(rank)], kNames[other]));
      std::abort();
    }
  }
}

void Taken(LockRank rank) { ++held[IndexOf(rank)]; }

void Freed(LockRank rank) { --held[IndexOf(rank)]; }

}  // namespace LockOrder

#endif
