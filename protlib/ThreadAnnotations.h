// SPDX-License-Identifier: Apache-2.0
#pragma once

// Which lock guards what, in a form that clang checks when it compiles with -Wthread-safety
// (clang documentation, "Thread Safety Analysis"). Other compilers see nothing.
#if defined(__clang__)
#define LOKA_ANNOTATE(x) __attribute__((x))
#else
#define LOKA_ANNOTATE(x)
#endif

#define LOKA_CAPABILITY(name) LOKA_ANNOTATE(capability(name))
#define LOKA_SCOPED_CAPABILITY LOKA_ANNOTATE(scoped_lockable)
#define LOKA_GUARDED_BY(lock) LOKA_ANNOTATE(guarded_by(lock))
#define LOKA_REQUIRES(...) LOKA_ANNOTATE(requires_capability(__VA_ARGS__))
#define LOKA_ACQUIRE(...) LOKA_ANNOTATE(acquire_capability(__VA_ARGS__))
#define LOKA_RELEASE(...) LOKA_ANNOTATE(release_capability(__VA_ARGS__))
#define LOKA_EXCLUDES(...) LOKA_ANNOTATE(locks_excluded(__VA_ARGS__))
