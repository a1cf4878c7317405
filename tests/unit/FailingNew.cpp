// SPDX-License-Identifier: Apache-2.0
#include "tests/unit/FailingNew.h"

#include <atomic>
#include <cstddef>
#include <cstdlib>
#include <limits>
#include <new>

#include "tests/support/HostCall.h"

namespace {

std::atomic<long long> living{0};

thread_local long long allocationCount = 0;
thread_local int countdown = 0;  // 0: none fails
thread_local bool failsFromThenOn = false;
thread_local bool failed = false;

bool IsToFail() {
  if (HostCall::IsInside()) return false;
  ++allocationCount;
  if (countdown == 0 || --countdown != 0) {
    return false;
  }
  countdown = failsFromThenOn ? 1 : 0;
  failed = true;
  return true;
}

// No machine has it, and a sanitizer ends the program when it is asked for.
constexpr std::size_t kTooMuchBytes = std::numeric_limits<std::size_t>::max() / 4;

void* Allocate(std::size_t sizeBytes) noexcept {
  if (IsToFail() || sizeBytes > kTooMuchBytes) return nullptr;
  void* const memory = std::malloc(sizeBytes == 0 ? 1 : sizeBytes);
  living += memory == nullptr ? 0 : 1;
  return memory;
}

void Free(void* memory) noexcept {
  living -= memory == nullptr ? 0 : 1;
  std::free(memory);
}

void* AllocateOrThrow(std::size_t sizeBytes) {
  void* const memory = Allocate(sizeBytes);
  if (memory == nullptr) {
    throw std::bad_alloc();
  }
  return memory;
}

}  // namespace

FailingNew::FailingNew(int nth, Mode mode) {
  failed = false;
  failsFromThenOn = mode == Mode::kFromThenOn;
  countdown = nth;
}

FailingNew::~FailingNew() { countdown = 0; }

bool FailingNew::HasFailed() const { return failed; }

long long FailingNew::Count() { return allocationCount; }

long long FailingNew::Living() { return living; }

// The program's own allocation functions, replaced as the language allows
// ([replacement.functions]).
void* operator new(std::size_t sizeBytes) { return AllocateOrThrow(sizeBytes); }
void* operator new[](std::size_t sizeBytes) { return AllocateOrThrow(sizeBytes); }
void* operator new(std::size_t sizeBytes, const std::nothrow_t& /*tag*/) noexcept {
  return Allocate(sizeBytes);
}
void* operator new[](std::size_t sizeBytes, const std::nothrow_t& /*tag*/) noexcept {
  return Allocate(sizeBytes);
}
void operator delete(void* memory) noexcept { Free(memory); }
void operator delete[](void* memory) noexcept { Free(memory); }
void operator delete(void* memory, std::size_t /*sizeBytes*/) noexcept { Free(memory); }
void operator delete[](void* memory, std::size_t /*sizeBytes*/) noexcept { Free(memory); }
void operator delete(void* memory, const std::nothrow_t& /*tag*/) noexcept { Free(memory); }
void operator delete[](void* memory, const std::nothrow_t& /*tag*/) noexcept { Free(memory); }
