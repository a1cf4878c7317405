// SPDX-License-Identifier: Apache-2.0
// libserialport with a scan by hand.
#include <fcntl.h>
#include <libserialport.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <array>
#include <cstdarg>
#include <cstdio>
#include <cstring>

#include "bench/reader/FrameScan.h"

namespace {

// The entry that stands in for a pseudo-terminal's.
const char* EntryFor(const char* path) {
  constexpr const char* kPseudoTerminals = "/sys/class/tty/pts/";
  return std::strncmp(path, kPseudoTerminals, std::strlen(kPseudoTerminals)) == 0
             ? "/sys/class/tty/tty"
             : path;
}

}  // namespace

// The library looks a port up in /sys/class/tty before it opens it, where pseudo-terminals do not
// stand, and asks for modem lines, which they do not have. These three answer that; reading, which
// is measured, is all the library's own.
extern "C" {
__attribute__((visibility("default"))) int __lxstat(int /*version*/, const char* path,
                                                    struct stat* status) {
  return lstat(EntryFor(path), status);
}
__attribute__((visibility("default"))) ssize_t readlink(const char* path, char* target,
                                                        std::size_t size) noexcept {
  return readlinkat(AT_FDCWD, EntryFor(path), target, size);
}
__attribute__((visibility("default"))) int ioctl(int file, unsigned long request, ...) noexcept {
  std::va_list more;
  va_start(more, request);
  void* const data = va_arg(more, void*);
  va_end(more);
  if (request == TIOCMGET) {
    *static_cast<int*>(data) = 0;
    return 0;
  }
  const bool isModemLine = request == TIOCMSET || request == TIOCMBIS || request == TIOCMBIC;
  return isModemLine ? 0 : static_cast<int>(syscall(SYS_ioctl, file, request, data));
}
}

int main(int argumentCount, char** arguments) {
  ReaderReport report(argumentCount, arguments);
  sp_port* port = nullptr;
  if (sp_get_port_by_name(report.Device(), &port) != SP_OK ||
      sp_open(port, SP_MODE_READ_WRITE) != SP_OK || sp_set_baudrate(port, 115200) != SP_OK ||
      sp_set_bits(port, 8) != SP_OK || sp_set_parity(port, SP_PARITY_NONE) != SP_OK ||
      sp_set_stopbits(port, 1) != SP_OK) {
    char* const why = sp_last_error_message();
    std::fprintf(stderr, "libserialport cannot open the port: %s\n", why);
    sp_free_error_message(why);
    return 5;
  }
  FrameScan scan(&report);
  std::array<unsigned char, 4096> buffer{};
  report.Ready();
  for (;;) {
    constexpr unsigned int kForever = 0;
    const int count =
        static_cast<int>(sp_blocking_read_next(port, buffer.data(), buffer.size(), kForever));
    if (count <= 0) {
      return 6;
    }
    if (!scan.Take(buffer.data(), static_cast<std::size_t>(count))) {
      return 0;
    }
  }
}
