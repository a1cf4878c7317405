// SPDX-License-Identifier: Apache-2.0
// Boost.Asio: async_read_until up to the suffix, again and again.
// clang-format off: the library uses std::exchange without including it, so <utility> comes first.
#include <utility>
// clang-format on

#include <boost/asio.hpp>
#include <string>

#include "bench/reader/ReaderReport.h"

namespace {

class Reader {
 public:
  Reader(boost::asio::io_context* context, ReaderReport* report)
      : port_(*context, report->Device()), report_(report) {
    port_.set_option(boost::asio::serial_port_base::baud_rate(115200));
  }

  void Next() {
    boost::asio::async_read_until(
        port_, boost::asio::dynamic_buffer(buffer_), '\x03',
        [this](const boost::system::error_code& error, std::size_t length) {
          if (error) {
            return;
          }
          const std::string_view frame(buffer_.data(), length - 1);
          const bool goesOn = report_->OnToken(WithoutPrefix(frame));
          buffer_.erase(0, length);
          if (goesOn) {
            Next();
          }
        });
  }

 private:
  boost::asio::serial_port port_;
  ReaderReport* const report_;
  std::string buffer_;
};

}  // namespace

int main(int argumentCount, char** arguments) {
  ReaderReport report(argumentCount, arguments);
  boost::asio::io_context context(1);
  Reader reader(&context, &report);
  report.Ready();
  reader.Next();
  context.run();
  return 0;
}
