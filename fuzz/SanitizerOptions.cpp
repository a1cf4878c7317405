// SPDX-License-Identifier: Apache-2.0
// A host may declare values that no memory holds; the driver then answers that it has none. The
// sanitizer has to let it: an allocation that is too large gives null instead of ending the
// program.
extern "C" const char* __asan_default_options() {
  return "allocator_may_return_null=1:max_allocation_size_mb=64:quarantine_size_mb=32";
}
