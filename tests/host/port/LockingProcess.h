// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <fcntl.h>
#include <sys/file.h>
#include <sys/ioctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <stdexcept>
#include <string>

// A child process that prepares itself, tells so and then lives until the object goes. Fork it
// before the test has started threads.
class WaitingProcess {
 public:
  int ProcessId() const { return processId_; }

  WaitingProcess(const WaitingProcess&) = delete;
  WaitingProcess& operator=(const WaitingProcess&) = delete;

 protected:
  // `prepare` runs in the child; false ends it.
  template <typename Prepare>
  explicit WaitingProcess(Prepare prepare) {
    int ready[2];
    if (pipe(ready) != 0) {
      throw std::runtime_error("pipe");
    }
    processId_ = fork();
    if (processId_ == 0) {
      const char sign = prepare() ? 'y' : 'n';
      (void)!write(ready[1], &sign, 1);
      for (;;) {
        pause();
      }
    }
    char sign = 'n';
    const bool isReady = read(ready[0], &sign, 1) == 1 && sign == 'y';
    close(ready[0]);
    close(ready[1]);
    if (!isReady) {
      End();
      throw std::runtime_error("the child is not ready");
    }
  }
  ~WaitingProcess() { End(); }

 private:
  void End() const {
    kill(processId_, SIGKILL);
    waitpid(processId_, nullptr, 0);
  }

  int processId_ = -1;
};

// Holds the lock on a device, as another program that uses it would.
class LockingProcess : public WaitingProcess {
 public:
  explicit LockingProcess(const std::string& path)
      : WaitingProcess([&path] {
          const int descriptor = open(path.c_str(), O_RDWR | O_NOCTTY);
          return descriptor >= 0 && flock(descriptor, LOCK_EX | LOCK_NB) == 0;
        }) {}
};

// Has a terminal as its controlling terminal, as a login has.
class SessionProcess : public WaitingProcess {
 public:
  explicit SessionProcess(const std::string& path)
      : WaitingProcess([&path] {
          setsid();
          const int descriptor = open(path.c_str(), O_RDWR);
          return descriptor >= 0 && ioctl(descriptor, TIOCSCTTY, 0) == 0;
        }) {}
};
