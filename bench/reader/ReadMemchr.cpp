// SPDX-License-Identifier: Apache-2.0
// The floor: read(2) into a buffer, memchr(3) for the suffix.
#include <unistd.h>

#include <array>
#include <cstring>

#include "bench/reader/RawLine.h"
#include "bench/reader/ReaderReport.h"

int main(int argumentCount, char** arguments) {
  ReaderReport report(argumentCount, arguments);
  const int line = OpenRawLine(report.Device());
  std::array<char, 65536> buffer{};
  std::size_t held = 0;
  report.Ready();
  for (;;) {
    const ssize_t count = read(line, buffer.data() + held, buffer.size() - held);
    if (count <= 0) {
      return 6;
    }
    const char* begin = buffer.data();
    const char* const end = begin + held + count;
    const char* searched = begin + held;
    while (const void* const found =
               std::memchr(searched, 0x03, static_cast<std::size_t>(end - searched))) {
      const char* const suffix = static_cast<const char*>(found);
      if (!report.OnToken(
              WithoutPrefix(std::string_view(begin, static_cast<std::size_t>(suffix - begin))))) {
        return 0;
      }
      begin = suffix + 1;
      searched = begin;
    }
    held = static_cast<std::size_t>(end - begin);
    std::memmove(buffer.data(), begin, held);
  }
}
