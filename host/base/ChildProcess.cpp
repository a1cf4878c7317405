// SPDX-License-Identifier: Apache-2.0
#include "host/base/ChildProcess.h"

#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <system_error>

#include "host/base/Deadline.h"
#include "host/base/ExitStatus.h"

namespace {

constexpr int kEndLimitMs = 5000;
constexpr int kAskStepMs = 5;
constexpr std::size_t kChunkBytes = 1024;

void ThrowIf(int errorNumber, const char* operation) {
  if (errorNumber != 0) {
    throw std::system_error(errorNumber, std::generic_category(), operation);
  }
}

// A socket pair instead of a pipe where we write, since only sockets can be written to without
// SIGPIPE when nobody reads any more.
struct Channels {
  std::array<int, 2> input{};   // [0] the child's stdin, [1] ours
  std::array<int, 2> output{};  // [0] ours, [1] the child's stdout
};

Channels MakeChannels() {
  Channels channels;
  ThrowIf(
      socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, channels.input.data()) == 0 ? 0 : errno,
      "socketpair");
  ThrowIf(pipe2(channels.output.data(), O_CLOEXEC) == 0 ? 0 : errno, "pipe2");
  return channels;
}

int Spawn(const std::string& file, const std::vector<std::string>& arguments,
          const Channels& channels) {
  posix_spawn_file_actions_t actions;
  posix_spawnattr_t attributes;
  posix_spawn_file_actions_init(&actions);
  posix_spawnattr_init(&attributes);
  posix_spawn_file_actions_adddup2(&actions, channels.input[0], STDIN_FILENO);
  posix_spawn_file_actions_adddup2(&actions, channels.output[1], STDOUT_FILENO);
  sigset_t none;
  sigemptyset(&none);
  posix_spawnattr_setsigmask(&attributes, &none);
  posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGMASK);

  std::vector<char*> argv;
  std::vector<std::string> copies = arguments;
  argv.reserve(copies.size() + 1);
  for (std::string& argument : copies) {
    argv.push_back(argument.data());
  }
  argv.push_back(nullptr);
  pid_t processId = -1;
  const int error =
      posix_spawn(&processId, file.c_str(), &actions, &attributes, argv.data(), environ);
  posix_spawnattr_destroy(&attributes);
  posix_spawn_file_actions_destroy(&actions);
  ThrowIf(error, "posix_spawn");
  return processId;
}

int ExitCode(int status) {
  return WIFSIGNALED(status) ? static_cast<int>(ExitStatus::kFirstSignal) + WTERMSIG(status)
                             : WEXITSTATUS(status);
}

}  // namespace

ChildProcess::ChildProcess(const std::string& file, const std::vector<std::string>& arguments) {
  const Channels channels = MakeChannels();
  input_ = channels.input[1];
  output_ = channels.output[0];
  try {
    processId_ = Spawn(file, arguments, channels);
  } catch (...) {
    for (const int descriptor : {channels.input[0], channels.output[1], input_, output_}) {
      (void)close(descriptor);
    }
    throw;
  }
  (void)close(channels.input[0]);
  (void)close(channels.output[1]);
}

ChildProcess::~ChildProcess() {
  if (Wait(Deadline::After(kEndLimitMs)) < 0) {
    (void)kill(processId_, SIGKILL);
    (void)waitpid(processId_, nullptr, 0);
  }
  (void)close(output_);
}

void ChildProcess::CloseInput() {
  if (input_ >= 0) {
    (void)close(input_);
    input_ = -1;
  }
}

void ChildProcess::Signal(int signalNumber) const {
  if (!isOver_) {
    (void)kill(processId_, signalNumber);
  }
}

bool ChildProcess::WriteLine(const std::string& line) const {
  const std::string text = line + "\n";
  std::size_t sent = 0;
  while (sent < text.size()) {
    const ssize_t count = send(input_, text.data() + sent, text.size() - sent, MSG_NOSIGNAL);
    if (count < 0 && errno != EINTR) {
      return false;
    }
    sent += count < 0 ? 0 : static_cast<std::size_t>(count);
  }
  return true;
}

bool ChildProcess::ReadLine(const Deadline& deadline, std::string* line) {
  for (;;) {
    const std::size_t end = pending_.find('\n');
    if (end != std::string::npos) {
      *line = pending_.substr(0, end);
      pending_.erase(0, end + 1);
      return true;
    }
    pollfd wait = {output_, POLLIN, 0};
    if (deadline.Poll(&wait, 1) <= 0) {
      return false;
    }
    std::array<char, kChunkBytes> chunk{};
    const ssize_t count = read(output_, chunk.data(), chunk.size());
    if (count == 0 || (count < 0 && errno != EINTR)) {
      return false;
    }
    pending_.append(chunk.data(), count < 0 ? 0 : static_cast<std::size_t>(count));
  }
}

int ChildProcess::Wait(const Deadline& deadline) {
  CloseInput();
  while (!isOver_) {
    int status = 0;
    const pid_t ended = waitpid(processId_, &status, WNOHANG);
    if (ended == processId_) {
      isOver_ = true;
      status_ = ExitCode(status);
    } else if (deadline.HasPassed()) {
      return -1;
    } else {
      Deadline::Earlier(deadline, Deadline::After(kAskStepMs)).Sleep();
    }
  }
  return status_;
}
