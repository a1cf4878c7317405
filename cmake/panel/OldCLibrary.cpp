// SPDX-License-Identifier: Apache-2.0
// Definitions of our own for two names that the C++ runtime library uses, so that the library for a
// panel runs with an old C library and stays small. Neither is exported. Both are real definitions
// that the linker takes before it looks into the archive: nothing is patched afterwards.
#include <cstdlib>
#include <exception>

// The runtime library skips atomic operations in a process with one thread. It asks a variable that
// the C library has since version 2.32 only. 0 means "there may be several", which is always right.
extern "C" {
extern char __libc_single_threaded;  // NOLINT(bugprone-reserved-identifier): that name is its
char __libc_single_threaded = 0;     // NOLINT(bugprone-reserved-identifier)
}

// The usual handler prints the name of an exception that nobody caught before it aborts, and brings
// a demangler of 30 KiB for that. No exception leaves the driver and a panel has no terminal, so
// what remains is the end of the process.
namespace __gnu_cxx {
void __verbose_terminate_handler() { std::abort(); }
}  // namespace __gnu_cxx
