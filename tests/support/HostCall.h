// SPDX-License-Identifier: Apache-2.0
#pragma once

// Marks the calling thread as being inside the host for as long as the object lives. What is
// allocated there is the host's business; a test that counts or fails the driver's allocations
// leaves it out.
class HostCall {
 public:
  HostCall();
  ~HostCall();
  HostCall(const HostCall&) = delete;
  HostCall& operator=(const HostCall&) = delete;

  static bool IsInside();

 private:
  const bool former_;
};
