// SPDX-License-Identifier: Apache-2.0
#include "host/base/SignalWatch.h"

#include <poll.h>
#include <pthread.h>
#include <sys/eventfd.h>
#include <sys/signalfd.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdint>
#include <cstdlib>
#include <thread>
#include <utility>

#include "host/base/Deadline.h"
#include "host/base/ExitStatus.h"

namespace {

// More than the driver's task and a port with bytes to send may take together.
constexpr int kCleanEndLimitMs = 8000;

// What must be put back whatever happens is registered with at_quick_exit.
[[noreturn]] void EndAtOnce(int signalNumber) {
  std::quick_exit(static_cast<int>(ExitStatus::kFirstSignal) + signalNumber);
}

}  // namespace

struct SignalWatch::State {
  Handler onSignal;
  sigset_t formerMask{};
  int signalDescriptor = -1;
  int endDescriptor = -1;
  std::thread thread;

  void Run();
};

void SignalWatch::State::Run() {
  int firstSignal = 0;
  Deadline limit = Deadline::After(0);
  for (;;) {
    std::array<pollfd, 2> waits = {{{signalDescriptor, POLLIN, 0}, {endDescriptor, POLLIN, 0}}};
    const int limitMs = firstSignal == 0 ? -1 : limit.RemainingMs();
    if (poll(waits.data(), waits.size(), limitMs) < 0 && errno != EINTR) {
      return;
    }
    if ((waits[1].revents & POLLIN) != 0) {
      return;
    }
    if (firstSignal != 0 && limit.HasPassed()) {
      EndAtOnce(firstSignal);
    }
    signalfd_siginfo info{};
    if (read(signalDescriptor, &info, sizeof info) != static_cast<ssize_t>(sizeof info)) {
      continue;
    }
    const int signalNumber = static_cast<int>(info.ssi_signo);
    if (firstSignal != 0) {
      EndAtOnce(signalNumber);
    }
    firstSignal = signalNumber;
    limit = Deadline::After(kCleanEndLimitMs);
    onSignal(signalNumber);
  }
}

SignalWatch::SignalWatch(Handler onSignal) : state_(std::make_unique<State>()) {
  state_->onSignal = std::move(onSignal);
  sigset_t watched;
  sigemptyset(&watched);
  for (const int signalNumber : {SIGINT, SIGTERM, SIGHUP}) {
    sigaddset(&watched, signalNumber);
  }
  pthread_sigmask(SIG_BLOCK, &watched, &state_->formerMask);
  state_->signalDescriptor = signalfd(-1, &watched, SFD_CLOEXEC | SFD_NONBLOCK);
  state_->endDescriptor = eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
  state_->thread = std::thread([state = state_.get()] { state->Run(); });
}

SignalWatch::~SignalWatch() {
  const std::uint64_t one = 1;
  (void)!write(state_->endDescriptor, &one, sizeof one);
  state_->thread.join();
  (void)close(state_->signalDescriptor);
  (void)close(state_->endDescriptor);
  pthread_sigmask(SIG_SETMASK, &state_->formerMask, nullptr);
}
