// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <condition_variable>
#include <deque>
#include <mutex>
#include <string>

// What a serial line does, on a clock of its own: bytes and silences in the order of the script. A
// receive never waits for real time: it moves the clock. Any thread.
class ScriptedLine {
 public:
  // Appends bytes that follow each other without a pause.
  void Feed(const std::string& bytes);
  // Appends a pause. A pause as long as a receive's time-out ends that receive.
  void Silence(long long milliseconds);

  // One receive: true and the byte, or false after timeoutMs on the line's clock.
  bool Receive(unsigned char* byte, int timeoutMs);

  // True once a receive has timed out behind the last scripted event.
  bool IsExhausted() const;

  // Bytes and silences that are not received yet.
  long long EventsLeft() const;

  long long NowMs() const;

  // A receive at the end of the script waits until more is fed or LetGo is called, instead of
  // timing out at once.
  void HoldAtEnd();
  void LetGo();
  // Waits until a receive stands at the end of the script.
  void WaitUntilHeld();

 private:
  struct Event {
    int byte;  // -1: a silence
    long long silenceMs;
  };

  mutable std::mutex mutex_;
  std::condition_variable changed_;
  std::deque<Event> events_;
  long long nowMs_ = 0;
  bool exhausted_ = false;
  bool holdAtEnd_ = false;
  int waiting_ = 0;
};
