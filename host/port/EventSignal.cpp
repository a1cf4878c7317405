// SPDX-License-Identifier: Apache-2.0
#include "host/port/EventSignal.h"

#include <sys/eventfd.h>
#include <unistd.h>

#include <cerrno>
#include <cstdint>
#include <system_error>

EventSignal::EventSignal() : fileDescriptor_(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)) {
  if (fileDescriptor_ < 0) {
    throw std::system_error(errno, std::generic_category(), "eventfd");
  }
}

EventSignal::~EventSignal() { (void)close(fileDescriptor_); }

void EventSignal::Raise() const {
  const std::uint64_t one = 1;
  (void)!write(fileDescriptor_, &one, sizeof one);
}

void EventSignal::Clear() const {
  std::uint64_t count = 0;
  (void)!read(fileDescriptor_, &count, sizeof count);
}
