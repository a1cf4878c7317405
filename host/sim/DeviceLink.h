// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

// A symbolic link that gives a port a lasting name, as the by-id links of real adapters do. An
// empty path makes no link at all. One thread.
class DeviceLink {
 public:
  explicit DeviceLink(std::string path) : path_(std::move(path)) {}

  // Removes the link if it is still ours.
  ~DeviceLink();

  DeviceLink(const DeviceLink&) = delete;
  DeviceLink& operator=(const DeviceLink&) = delete;

  // Lets the link point to `target`; a link that is there already is replaced in one step
  // (rename(2)). Throws std::runtime_error when something else has that name, and when the link
  // cannot be made.
  void PointTo(const std::string& target);

  // Removes the link unless it now points to somebody else's port.
  void Remove();

  const std::string& Path() const { return path_; }

 private:
  const std::string path_;
  std::string target_;  // empty: there is no link of ours
};
