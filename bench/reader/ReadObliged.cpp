// SPDX-License-Identifier: Apache-2.0
// Loops that ask for every byte under a semaphore, on a mutex. The last argument is "bare"
// (compares the whole tail for each byte), "lean" (the suffix's last byte first) or "full": lean,
// and a queue under a second semaphore, a yield between tokens and a thread that takes what is
// queued step by step, as a panel does through its tags.
#include <sched.h>

#include <condition_variable>
#include <cstdio>
#include <deque>
#include <mutex>
#include <string>
#include <thread>

#include "bench/reader/ObligedHost.h"
#include "bench/reader/ObligedLoop.h"
#include "bench/reader/RawLine.h"
#include "bench/reader/ReaderReport.h"

namespace {

constexpr std::size_t kQueueTokens = 10000;

// Wakes the consumer when the receiver has used up what it had.
class Pause {
 public:
  void Tell() {
    const std::lock_guard<std::mutex> lock(mutex_);
    ++count_;
    changed_.notify_all();
  }
  void Wait(unsigned long* seen) {
    std::unique_lock<std::mutex> lock(mutex_);
    changed_.wait(lock, [&] { return count_ != *seen; });
    *seen = count_;
  }

 private:
  std::mutex mutex_;
  std::condition_variable changed_;
  unsigned long count_ = 0;
};

class Queue {
 public:
  void Push(std::string_view token) {
    semaphore_->Lock();
    if (tokens_.size() >= kQueueTokens) {
      tokens_.pop_front();
    }
    tokens_.emplace_back(token);
    semaphore_->Unlock();
  }
  std::size_t Count() {
    semaphore_->Lock();
    const std::size_t count = tokens_.size();
    semaphore_->Unlock();
    return count;
  }
  std::size_t FrontLength() {
    semaphore_->Lock();
    const std::size_t length = tokens_.front().size();
    semaphore_->Unlock();
    return length;
  }
  void CopyFront(std::string* token) {
    semaphore_->Lock();
    *token = tokens_.front();
    semaphore_->Unlock();
  }
  void Pop() {
    semaphore_->Lock();
    tokens_.pop_front();
    semaphore_->Unlock();
  }

 private:
  const std::unique_ptr<ISemaphore> semaphore_ = MakeMutexSemaphore();
  std::deque<std::string> tokens_;
};

int RunAlone(ReaderReport* report, ObligedLoop::Compare compare) {
  const int line = OpenRawLine(report->Device());
  const auto port = MakePlainPort(line, [] {});
  const auto semaphore = MakeMutexSemaphore();
  ObligedLoop loop(port.get(), semaphore.get(), compare);
  report->Ready();
  std::string_view token;
  while (!loop.Next(&token) || report->OnToken(token)) {
  }
  return 0;
}

int RunFull(ReaderReport* report) {
  const int line = OpenRawLine(report->Device());
  Pause pause;
  Queue queue;
  const auto port = MakePlainPort(line, [&] { pause.Tell(); });
  const auto semaphore = MakeMutexSemaphore();
  report->Ready();
  std::thread receiver([&] {
    ObligedLoop loop(port.get(), semaphore.get(), ObligedLoop::Compare::kLastByteFirst);
    std::string_view token;
    bool isLast = false;
    while (!isLast) {
      if (loop.Next(&token)) {
        isLast = !token.empty() && token.front() == 'Z';
        queue.Push(token);
      }
      sched_yield();
    }
    pause.Tell();
  });
  unsigned long seen = 0;
  std::string token;
  for (bool goesOn = true; goesOn; pause.Wait(&seen)) {
    while (goesOn && queue.Count() > 0) {
      const std::size_t length = queue.FrontLength();
      queue.CopyFront(&token);
      queue.Pop();
      goesOn = length == token.size() && report->OnToken(token);
    }
    if (!goesOn) {
      break;
    }
  }
  receiver.join();
  return 0;
}

}  // namespace

int main(int argumentCount, char** arguments) {
  ReaderReport report(argumentCount, arguments);
  const std::string kind = argumentCount > 4 ? arguments[4] : "";
  if (kind == "bare") {
    return RunAlone(&report, ObligedLoop::Compare::kWholeTail);
  }
  if (kind == "lean") {
    return RunAlone(&report, ObligedLoop::Compare::kLastByteFirst);
  }
  if (kind == "full") {
    return RunFull(&report);
  }
  std::fputs("the last argument is bare, lean or full\n", stderr);
  return 2;
}
