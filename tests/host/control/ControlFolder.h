// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdlib>
#include <string>

#include "tests/host/support/TemporaryFolder.h"

// Lets this process look for control sockets in a folder of its own for as long as it lives. The
// folder itself is not there yet.
class ControlFolderForTest {
 public:
  ControlFolderForTest() { (void)setenv("LOKA_RUNTIME_DIR", Path().c_str(), 1); }
  ~ControlFolderForTest() { (void)unsetenv("LOKA_RUNTIME_DIR"); }
  ControlFolderForTest(const ControlFolderForTest&) = delete;
  ControlFolderForTest& operator=(const ControlFolderForTest&) = delete;

  std::string Path() const { return parent_.File("control"); }
  std::string File(const std::string& name) const { return Path() + "/" + name; }
  const TemporaryFolder& Parent() const { return parent_; }

 private:
  TemporaryFolder parent_;
};
