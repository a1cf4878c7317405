// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>

// A minimal host that runs somewhere, and the other end of its serial line.
class HostSession {
 public:
  HostSession() = default;
  virtual ~HostSession() = default;
  HostSession(const HostSession&) = delete;
  HostSession& operator=(const HostSession&) = delete;

  // Starts the host with this configuration; its first line, which is "started" or an error.
  virtual std::string Start(const std::string& configuration) = 0;
  // Ends it; its exit status.
  virtual int End() = 0;
  // Runs a console command; what the host prints for it, up to the line that says true or false.
  virtual std::string Ask(const std::string& command) = 0;

  virtual void SendOnLine(const std::string& bytes) = 0;
  // So many bytes that the host has sent, or those that came before the time was over.
  virtual std::string TakeFromLine(std::size_t count) = 0;
  // What the kernel has set for the port, as "9600 7O2"; empty for a line that cannot keep it.
  virtual std::string LineSettings() = 0;
};
