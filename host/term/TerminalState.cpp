// SPDX-License-Identifier: Apache-2.0
#include "host/term/TerminalState.h"

#include <termios.h>

#include <array>
#include <atomic>
#include <csignal>
#include <cstddef>
#include <cstdlib>
#include <mutex>

#include "host/base/Deadline.h"

namespace {

// Ends of the program that no destructor sees.
constexpr std::array<int, 6> kFatalSignals = {SIGABRT, SIGBUS, SIGFPE, SIGILL, SIGQUIT, SIGSEGV};

struct Saved {
  std::atomic<int> fileDescriptor{-1};  // -1: nothing to put back
  termios state{};
  std::array<struct sigaction, kFatalSignals.size()> formerActions{};
};

// One for the process, since signal handlers get no argument. Not guarded: written while the
// descriptor is -1 only.
Saved& TheSaved() {
  static Saved saved;
  return saved;
}

// May be called in a signal handler: tcsetattr is safe there (signal-safety(7)).
void PutBack() {
  Saved& saved = TheSaved();
  const int fileDescriptor = saved.fileDescriptor.exchange(-1);
  if (fileDescriptor >= 0) {
    (void)tcsetattr(fileDescriptor, TCSANOW, &saved.state);
  }
}

// The thread that edits lines goes on until the process ends, and may be about to set what it had
// read before.
void PutBackForGood() {
  constexpr int kLongerThanOneChangeMs = 20;
  Saved& saved = TheSaved();
  const int fileDescriptor = saved.fileDescriptor.load();
  PutBack();
  if (fileDescriptor >= 0) {
    Deadline::After(kLongerThanOneChangeMs).Sleep();
    (void)tcsetattr(fileDescriptor, TCSANOW, &saved.state);
  }
}

// Leaves the end itself to whoever handled the signal before.
void OnFatalSignal(int signalNumber, siginfo_t* info, void* /*context*/) {
  PutBack();
  for (std::size_t i = 0; i < kFatalSignals.size(); ++i) {
    if (kFatalSignals.at(i) == signalNumber) {
      (void)sigaction(signalNumber, &TheSaved().formerActions.at(i), nullptr);
    }
  }
  // A fault of the code happens again by itself, with its address; a signal that was sent does not.
  const bool isSent = info->si_code <= 0 || signalNumber == SIGABRT || signalNumber == SIGQUIT;
  if (isSent) {
    (void)raise(signalNumber);
  }
}

}  // namespace

TerminalState::TerminalState(int fileDescriptor) {
  Saved& saved = TheSaved();
  if (tcgetattr(fileDescriptor, &saved.state) != 0) {
    return;
  }
  static std::once_flag isRegistered;
  std::call_once(isRegistered, [] { (void)std::at_quick_exit(PutBackForGood); });
  saved.fileDescriptor = fileDescriptor;
  struct sigaction action {};
  action.sa_sigaction = OnFatalSignal;
  action.sa_flags = SA_SIGINFO;
  for (std::size_t i = 0; i < kFatalSignals.size(); ++i) {
    (void)sigaction(kFatalSignals.at(i), &action, &saved.formerActions.at(i));
  }
}

TerminalState::~TerminalState() {
  const Saved& saved = TheSaved();
  if (saved.fileDescriptor.load() < 0) {
    return;
  }
  PutBack();
  for (std::size_t i = 0; i < kFatalSignals.size(); ++i) {
    (void)sigaction(kFatalSignals.at(i), &saved.formerActions.at(i), nullptr);
  }
}
