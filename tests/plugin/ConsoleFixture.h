// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "tests/plugin/PluginFixture.h"

// What a console command gave.
struct ConsoleReply {
  bool result = false;
  std::string bytes;        // the whole reply buffer
  std::string text;         // up to the first zero
  bool terminated = false;  // whether there is one
  bool untouched = false;   // nothing was written into the buffer
};

// A protocol whose console is used. Every reply goes through a guarded buffer.
class ConsoleFixture : public ProtocolFixture {
 protected:
  // Frames received tokens with 02 and 03.
  void Run(const std::string& more = "") {
    ProtocolFixture::Run("rx_prefix=02 rx_suffix=03 " + more);
  }

  ConsoleReply Command(const std::string& command, int replyBytes = 2000) {
    GuardedBuffer buffer(static_cast<std::size_t>(replyBytes));
    ConsoleReply reply;
    reply.result = P()->DoCommand(command.c_str(), buffer.Chars(), replyBytes);
    EXPECT_TRUE(buffer.AreGuardsIntact()) << command;
    reply.untouched = buffer.IsUntouched();
    reply.bytes = buffer.Bytes();
    const std::size_t end = reply.bytes.find('\0');
    reply.terminated = end != std::string::npos;
    reply.text = reply.bytes.substr(0, end);
    return reply;
  }

  std::string GetInfo(int sizeBytes) {
    GuardedBuffer buffer(static_cast<std::size_t>(sizeBytes));
    const int length = P()->GetInfo(buffer.Chars(), sizeBytes);
    EXPECT_TRUE(buffer.AreGuardsIntact());
    const std::string bytes = buffer.Bytes();
    const auto written = static_cast<std::size_t>(length);
    EXPECT_LE(written, bytes.size());
    EXPECT_EQ(bytes.substr(written),
              std::string(bytes.size() - written, static_cast<char>(GuardedBuffer::kFill)));
    return bytes.substr(0, written);
  }

  // What the information text says about the scripted host's services.
  std::string ServiceLines() {
    return Line(host_.MultiTask()) + Line(host_.SerialFactory()) + SocketLine();
  }

 private:
  static std::string Line(const INamedInterface& service) {
    return std::string(service.GetImpName()) + " v." + std::to_string(service.GetImpVersion()) +
           "\n";
  }
  std::string SocketLine() {
    auto* sockets = static_cast<INamedInterface*>(host_.CreateInterface("ISocketFactory"));
    const std::string line = Line(*sockets);
    host_.ReleaseInterface(sockets);
    return line;
  }
};
