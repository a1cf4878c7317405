// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <exception>
#include <utility>

// The one pattern that keeps exceptions inside an interface operation: runs the body and returns
// its result, or `onFailure` when memory ran out on the way. Only std::exception is caught, so that
// a host that cancels a thread can still unwind through the driver.
template <typename Result, typename Body>
Result NoThrow(Result onFailure, Body&& body) {
  try {
    return std::forward<Body>(body)();
  } catch (const std::exception&) {
    return onFailure;
  }
}
