// SPDX-License-Identifier: Apache-2.0
#pragma once

// LOKA_SANITIZED is defined when this is built with the address or the thread sanitizer.
#if defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
#define LOKA_SANITIZED
#endif
#endif
#if !defined(LOKA_SANITIZED) && (defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__))
#define LOKA_SANITIZED
#endif
