// SPDX-License-Identifier: Apache-2.0
#include "bench/memory/Allocations.h"

#include <cstdlib>
#include <new>

namespace {

long long count = 0;  // everything is measured on one thread

void* Allocate(std::size_t size) {
  ++count;
  return std::malloc(size == 0 ? 1 : size);
}

}  // namespace

long long AllocationCount() { return count; }

void* operator new(std::size_t size) {
  void* const place = Allocate(size);
  if (place == nullptr) {
    throw std::bad_alloc();
  }
  return place;
}

void* operator new(std::size_t size, const std::nothrow_t& /*tag*/) noexcept {
  return Allocate(size);
}

void* operator new[](std::size_t size) { return operator new(size); }

void* operator new[](std::size_t size, const std::nothrow_t& /*tag*/) noexcept {
  return Allocate(size);
}

void operator delete(void* place) noexcept { std::free(place); }
void operator delete(void* place, std::size_t /*size*/) noexcept { std::free(place); }
void operator delete[](void* place) noexcept { std::free(place); }
void operator delete[](void* place, std::size_t /*size*/) noexcept { std::free(place); }
