// SPDX-License-Identifier: Apache-2.0
// gensio with a scan by hand in its read callback.
#include <gensio/gensio.h>

#include <cstdio>
#include <string>

#include "bench/reader/FrameScan.h"

namespace {

struct Reader {
  FrameScan scan;
  gensio_os_funcs* os;
  gensio_waiter* done;
  bool isOver;
};

int OnEvent(gensio* /*io*/, void* userData, int event, int error, unsigned char* bytes,
            gensiods* count, const char* const* /*auxiliary*/) {
  auto* const reader = static_cast<Reader*>(userData);
  if (event != GENSIO_EVENT_READ) {
    return GE_NOTSUP;
  }
  const bool goesOn = error == 0 && !reader->isOver && reader->scan.Take(bytes, *count);
  if (!goesOn && !reader->isOver) {
    reader->isOver = true;
    gensio_os_funcs_wake(reader->os, reader->done);
  }
  return 0;
}

}  // namespace

int main(int argumentCount, char** arguments) {
  ReaderReport report(argumentCount, arguments);
  gensio_os_funcs* os = nullptr;
  if (gensio_default_os_hnd(0, &os) != 0) {
    return 5;
  }
  Reader reader{FrameScan(&report), os, gensio_os_funcs_alloc_waiter(os), false};
  const std::string name = std::string("serialdev(nouucplock),") + report.Device() + ",115200n81";
  gensio* io = nullptr;
  const int error = str_to_gensio(name.c_str(), os, OnEvent, &reader, &io);
  if (error != 0 || gensio_open_s(io) != 0) {
    std::fprintf(stderr, "gensio cannot open the port: %s\n", gensio_err_to_str(error));
    return 5;
  }
  report.Ready();
  gensio_set_read_callback_enable(io, true);
  gensio_os_funcs_wait(os, reader.done, 1, nullptr);
  return 0;
}
