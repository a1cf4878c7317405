// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <memory>

// Turns SIGINT, SIGTERM and SIGHUP into calls on an ordinary thread. The first one calls the
// handler; a second one ends the process at once with 128 + n, for the case that a clean end takes
// too long. So does the watch itself 8000 ms behind the first one: output that nobody reads could
// otherwise keep the process for ever. Create it before any other thread, so that all of them leave
// the signals alone.
class SignalWatch {
 public:
  using Handler = std::function<void(int signalNumber)>;
  explicit SignalWatch(Handler onSignal);

  // Gives the signals their former treatment back.
  ~SignalWatch();

  SignalWatch(const SignalWatch&) = delete;
  SignalWatch& operator=(const SignalWatch&) = delete;

 private:
  struct State;
  const std::unique_ptr<State> state_;
};
