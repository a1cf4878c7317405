// SPDX-License-Identifier: Apache-2.0
// Stands in front of the C library's clocks of the time of day (LD_PRELOAD): adds the microseconds
// that the file LOKA_SET_CLOCK holds, which its test changes while the program runs. Clocks that
// nobody can set are as they were.
#include <fcntl.h>
#include <sys/mman.h>
#include <sys/syscall.h>
#include <sys/time.h>
#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <ctime>

namespace {

constexpr std::int64_t kUsPerSecond = 1000000;
constexpr long kNsPerUs = 1000;

const volatile std::int64_t* MapOffset() {
  const char* const path = std::getenv("LOKA_SET_CLOCK");
  const int file = path == nullptr ? -1 : open(path, O_RDONLY | O_CLOEXEC);
  if (file < 0) {
    std::abort();
  }
  void* const place = mmap(nullptr, sizeof(std::int64_t), PROT_READ, MAP_SHARED, file, 0);
  close(file);
  if (place == MAP_FAILED) {
    std::abort();
  }
  return static_cast<const volatile std::int64_t*>(place);
}

std::int64_t SetTimeUs() {
  static const volatile std::int64_t* const offsetUs = MapOffset();
  timespec now{};
  (void)syscall(SYS_clock_gettime, CLOCK_REALTIME, &now);
  return now.tv_sec * kUsPerSecond + now.tv_nsec / kNsPerUs + *offsetUs;
}

}  // namespace

extern "C" __attribute__((visibility("default"))) int clock_gettime(clockid_t clock,
                                                                    timespec* time) noexcept {
  if (clock != CLOCK_REALTIME && clock != CLOCK_REALTIME_COARSE) {
    return static_cast<int>(syscall(SYS_clock_gettime, clock, time));
  }
  const std::int64_t nowUs = SetTimeUs();
  time->tv_sec = nowUs / kUsPerSecond;
  time->tv_nsec = static_cast<long>(nowUs % kUsPerSecond) * kNsPerUs;
  return 0;
}

extern "C" __attribute__((visibility("default"))) int gettimeofday(timeval* time,
                                                                   void* /*zone*/) noexcept {
  const std::int64_t nowUs = SetTimeUs();
  time->tv_sec = nowUs / kUsPerSecond;
  time->tv_usec = nowUs % kUsPerSecond;
  return 0;
}

extern "C" __attribute__((visibility("default"))) time_t time(time_t* result) noexcept {
  const time_t now = SetTimeUs() / kUsPerSecond;
  if (result != nullptr) {
    *result = now;
  }
  return now;
}
