// SPDX-License-Identifier: Apache-2.0
#include "bench/reader/ReaderReport.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <unistd.h>

#include <cinttypes>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <string>

namespace {

constexpr std::size_t kNumberCharacters = 8;
constexpr std::size_t kStampsAtFirst = std::size_t{1} << 16;
constexpr int kHexadecimal = 16;
constexpr std::int64_t kNsPerS = 1'000'000'000;

std::int64_t NowNs(clockid_t clock) {
  timespec now{};
  clock_gettime(clock, &now);
  return static_cast<std::int64_t>(now.tv_sec) * kNsPerS + now.tv_nsec;
}

rusage Usage() {
  rusage usage{};
  getrusage(RUSAGE_SELF, &usage);
  return usage;
}

// Resident memory now, in KiB.
long ResidentKib() {
  long pages = 0;
  if (std::FILE* const file = std::fopen("/proc/self/statm", "r")) {
    if (std::fscanf(file, "%*d %ld", &pages) != 1) {
      pages = 0;
    }
    std::fclose(file);
  }
  return pages * (sysconf(_SC_PAGESIZE) / 1024);
}

std::atomic<std::uint64_t>* MapCounter(const char* path) {
  const int file = open(path, O_RDWR | O_CLOEXEC);
  void* const place =
      file < 0 ? MAP_FAILED
               : mmap(nullptr, sizeof(std::uint64_t), PROT_READ | PROT_WRITE, MAP_SHARED, file, 0);
  if (place == MAP_FAILED) {
    std::perror(path);
    std::exit(2);
  }
  return static_cast<std::atomic<std::uint64_t>*>(place);
}

}  // namespace

ReaderReport::ReaderReport(int argumentCount, char** arguments) {
  if (argumentCount < 4) {
    std::fprintf(stderr, "usage: %s DEVICE STAMPS PROGRESS [more]\n", arguments[0]);
    std::exit(2);
  }
  device_ = arguments[1];
  stampFile_ = arguments[2];
  isStamping_ = std::strcmp(stampFile_, "-") != 0;
  if (isStamping_) {
    stamps_.reserve(kStampsAtFirst);
  }
  if (std::strcmp(arguments[3], "-") != 0) {
    progress_ = MapCounter(arguments[3]);
  }
}

ReaderReport::~ReaderReport() = default;

void ReaderReport::Ready() {
  std::puts("ready");
  std::fflush(stdout);
  const rusage usage = Usage();
  startVoluntary_ = usage.ru_nvcsw;
  startInvoluntary_ = usage.ru_nivcsw;
  startCpuNs_ = NowNs(CLOCK_PROCESS_CPUTIME_ID);
}

void ReaderReport::Stamp(std::string_view token) {
  const auto nowNs = static_cast<std::uint64_t>(NowNs(CLOCK_MONOTONIC));
  const std::string number(token.substr(0, kNumberCharacters));
  stamps_.push_back(std::strtoull(number.c_str(), nullptr, kHexadecimal));
  stamps_.push_back(nowNs);
}

void ReaderReport::Finish() {
  const std::int64_t cpuNs = NowNs(CLOCK_PROCESS_CPUTIME_ID) - startCpuNs_;
  const rusage usage = Usage();
  std::printf("{\"tokens\": %" PRIu64 ", \"bytes\": %" PRIu64 ", \"cpu_ns\": %" PRId64
              ", \"voluntary\": %ld, \"involuntary\": %ld, \"rss_kib\": %ld}\n",
              tokens_, bytes_, cpuNs, usage.ru_nvcsw - startVoluntary_,
              usage.ru_nivcsw - startInvoluntary_, ResidentKib());
  std::fflush(stdout);
  if (!isStamping_) {
    return;
  }
  std::FILE* const file = std::fopen(stampFile_, "wb");
  if (file == nullptr ||
      std::fwrite(stamps_.data(), sizeof stamps_[0], stamps_.size(), file) != stamps_.size() ||
      std::fclose(file) != 0) {
    std::perror(stampFile_);
    std::exit(1);
  }
}
