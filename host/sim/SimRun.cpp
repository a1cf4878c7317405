// SPDX-License-Identifier: Apache-2.0
#include "host/sim/SimRun.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <exception>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>

#include "host/base/Deadline.h"
#include "host/base/ExitStatus.h"
#include "host/base/SignalWatch.h"
#include "host/events/WallClock.h"
#include "host/sim/DeviceCatalogue.h"
#include "host/sim/DeviceLink.h"
#include "host/sim/DevicePort.h"
#include "host/sim/FaultMaker.h"
#include "host/sim/Interval.h"
#include "host/sim/Outbox.h"
#include "host/sim/SimReport.h"

namespace {

using Time = std::chrono::steady_clock::time_point;
using std::chrono::milliseconds;

constexpr milliseconds kFirstMessage(250);
constexpr milliseconds kLongestWait(60 * 60 * 1000);
// A closed port does not wake anybody up when it is opened.
constexpr milliseconds kClosedStep(20);
constexpr milliseconds kCommandSilence(100);
constexpr int kDrainMs = 2000;
constexpr int kMaxChunksAtOnce = 16;
// Answers draw their faults from numbers of their own, so that questions do not move the faults of
// the messages at the interval.
constexpr std::uint64_t kAnswerNumbers = 1ULL << 32U;

Time Now() { return std::chrono::steady_clock::now(); }

std::int64_t MicrosecondsOf(Time time) {
  return std::chrono::duration_cast<std::chrono::microseconds>(time.time_since_epoch()).count();
}

int Code(ExitStatus status) { return static_cast<int>(status); }

// The signal that ends the run, and a descriptor that becomes readable with it.
class StopSignal {
 public:
  StopSignal()
      : descriptor_(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)),
        watch_([this](int signalNumber) { Raise(signalNumber); }) {}
  ~StopSignal() { (void)close(descriptor_); }
  StopSignal(const StopSignal&) = delete;
  StopSignal& operator=(const StopSignal&) = delete;

  int Number() const { return number_; }
  int FileDescriptor() const { return descriptor_; }

 private:
  void Raise(int signalNumber) {
    number_ = signalNumber;
    const std::uint64_t one = 1;
    (void)!write(descriptor_, &one, sizeof one);
  }

  std::atomic<int> number_{0};
  const int descriptor_;
  SignalWatch watch_;
};

const DeviceKind& KindNamed(const std::string& name) {
  const std::vector<DeviceKind>& kinds = DeviceKinds();
  const auto found = std::find_if(kinds.begin(), kinds.end(),
                                  [&](const DeviceKind& kind) { return kind.name == name; });
  if (found == kinds.end()) {
    throw std::invalid_argument("no such device: " + name);
  }
  return *found;
}

DeviceSettings SettingsOf(const DeviceKind& kind, const SimOptions& options) {
  DeviceSettings settings = options.device;
  settings.framing.prefix = options.prefix.value_or(kind.framing.prefix);
  settings.framing.suffix = options.suffix.value_or(kind.framing.suffix);
  return settings;
}

class SimRun {
 public:
  explicit SimRun(const SimOptions& options)
      : options_(options),
        kind_(KindNamed(options.kind)),
        settings_(SettingsOf(kind_, options)),
        device_(kind_.make(settings_)),
        faults_(options.faults, settings_.seed),
        interval_(milliseconds(options.everyMs.value_or(kind_.everyMs))),
        unplugs_(milliseconds(options.unplugEveryMs)),
        report_(options.isJson),
        link_(options.linkPath),
        outbox_([this](std::string_view bytes) { return Write(bytes); },
                [this](const SentMessage& message) { OnSent(message); }) {}

  int Run();

 private:
  void Plug();
  void Unplug(Time now);
  void FollowPlug(Time now);
  void FollowHost(Time now);
  void TakeInput(Time now);
  void SpeakUnasked(Time now);
  void Take(const DeviceAnswer& answer, Time now);
  void Send(DeviceMessage message, Time now, std::uint64_t faultNumber);
  std::size_t Write(std::string_view bytes);
  void OnSent(const SentMessage& message);
  bool IsOver(Time now) const;
  bool MayMakeMore() const { return options_.count == 0 || made_ < options_.count; }
  Time NextTime(Time now) const;
  void Wait(Time now) const;

  const SimOptions options_;
  const DeviceKind& kind_;
  const DeviceSettings settings_;
  const std::unique_ptr<Device> device_;
  const FaultMaker faults_;
  StopSignal stop_;
  Interval interval_;
  Interval unplugs_;
  SimReport report_;
  // The link goes before the port does, so that it never points to somebody else's.
  DevicePort port_;
  DeviceLink link_;
  Outbox outbox_;
  bool isOpen_ = false;
  std::optional<Time> pluggedAgainAt_;
  std::optional<Time> silenceAt_;
  std::optional<Time> endAt_;
  std::string whyLost_;
  std::int64_t wallOffsetUs_ = 0;  // time of day minus the steady clock
  std::uint64_t made_ = 0;         // messages put into the outbox, echoes not counted
  std::uint64_t numbers_ = 0;      // the same, echoes counted
  std::uint64_t unasked_ = 0;
  std::uint64_t answers_ = 0;
};

int SimRun::Run() {
  Plug();
  (void)std::fprintf(stderr, "loka: %s, receive it with: %s\n", kind_.name,
                     ConfigurationFor(kind_, settings_).c_str());
  const Time start = Now();
  unplugs_.Begin(start + milliseconds(options_.unplugEveryMs));
  if (options_.forMs > 0) {
    endAt_ = start + milliseconds(options_.forMs);
  }
  while (stop_.Number() == 0 && !IsOver(Now())) {
    const Time now = Now();
    // Read once a round, so that messages of one round keep their order.
    wallOffsetUs_ = WallClockUs() - MicrosecondsOf(now);
    FollowPlug(now);
    FollowHost(now);
    TakeInput(now);
    SpeakUnasked(now);
    outbox_.Step(now);
    Wait(Now());
  }
  if (stop_.Number() == 0) {
    port_.Drain(Deadline::After(kDrainMs));
  }
  report_.OnEnd(interval_.Missed());
  return stop_.Number() == 0 ? Code(ExitStatus::kDone)
                             : Code(ExitStatus::kFirstSignal) + stop_.Number();
}

void SimRun::Plug() {
  port_.Plug();
  link_.PointTo(port_.Path());
  report_.OnPort("plugged", port_.Path(), link_.Path());
}

// Without the port its name may soon belong to somebody else's, so the link goes first.
void SimRun::Unplug(Time now) {
  link_.Remove();
  port_.Unplug();
  isOpen_ = false;
  silenceAt_.reset();
  pluggedAgainAt_ = now + milliseconds(options_.unplugForMs);
  report_.OnPort("unplugged", "", link_.Path());
}

void SimRun::FollowPlug(Time now) {
  if (pluggedAgainAt_ && now >= *pluggedAgainAt_) {
    pluggedAgainAt_.reset();
    Plug();
  }
  if (unplugs_.Take(now) && port_.IsPlugged()) {
    Unplug(now);
  }
}

void SimRun::FollowHost(Time now) {
  const bool isOpen = port_.IsOpen();
  if (isOpen == isOpen_) {
    return;
  }
  isOpen_ = isOpen;
  report_.OnPort(isOpen ? "open" : "closed", port_.Path(), link_.Path());
  if (isOpen && !interval_.HasBegun()) {
    interval_.Begin(now + kFirstMessage);
  }
  if (!isOpen && !port_.Flush()) {
    Plug();
  }
}

void SimRun::TakeInput(Time now) {
  for (int i = 0; i < kMaxChunksAtOnce; ++i) {
    const std::string bytes = port_.Read();
    if (bytes.empty()) {
      break;
    }
    silenceAt_ = now + kCommandSilence;
    Take(device_->OnBytes(bytes), now);
  }
  if (silenceAt_ && now >= *silenceAt_) {
    silenceAt_.reset();
    Take(device_->OnSilence(), now);
  }
}

void SimRun::Take(const DeviceAnswer& answer, Time now) {
  for (const DeviceInput& input : answer.received) {
    report_.OnReceived(input);
  }
  for (const DeviceMessage& reply : answer.replies) {
    Send(reply, now, kAnswerNumbers + ++answers_);
  }
}

void SimRun::SpeakUnasked(Time now) {
  if (!interval_.Take(now)) {
    return;
  }
  for (int i = 0; i < options_.burst && MayMakeMore(); ++i) {
    std::optional<DeviceMessage> message = device_->NextMessage();
    if (!message) {
      return;
    }
    Send(std::move(*message), now, ++unasked_);
  }
}

void SimRun::Send(DeviceMessage message, Time now, std::uint64_t faultNumber) {
  made_ += message.isVerbatim ? 0U : 1U;
  WireMessage wire = faults_.Make(faultNumber, message);
  outbox_.Add(++numbers_, std::move(message), std::move(wire), now);
}

std::size_t SimRun::Write(std::string_view bytes) {
  const std::size_t taken = port_.Write(bytes);
  if (taken < bytes.size() && whyLost_.empty()) {
    whyLost_ = !port_.IsPlugged() ? "unplugged" : port_.IsOpen() ? "full" : "closed";
  }
  return taken;
}

void SimRun::OnSent(const SentMessage& message) {
  report_.OnSent(message, whyLost_, wallOffsetUs_ + MicrosecondsOf(message.begin));
  whyLost_.clear();
}

bool SimRun::IsOver(Time now) const {
  return (endAt_ && now >= *endAt_) || (!MayMakeMore() && outbox_.IsEmpty());
}

Time SimRun::NextTime(Time now) const {
  Time next = now + kLongestWait;
  for (const std::optional<Time>& time : {interval_.Next(), unplugs_.Next(), outbox_.NextDue(),
                                          pluggedAgainAt_, silenceAt_, endAt_}) {
    next = std::min(next, time.value_or(next));
  }
  return isOpen_ || !port_.IsPlugged() ? next : std::min(next, now + kClosedStep);
}

void SimRun::Wait(Time now) const {
  if (IsOver(now)) {
    return;
  }
  std::array<pollfd, 2> waits = {
      {{stop_.FileDescriptor(), POLLIN, 0}, {isOpen_ ? port_.FileDescriptor() : -1, POLLIN, 0}}};
  (void)Deadline::At(NextTime(now)).Poll(waits.data(), waits.size());
}

}  // namespace

int RunSim(const SimOptions& options) {
  try {
    SimRun run(options);
    return run.Run();
  } catch (const std::exception& error) {
    (void)std::fprintf(stderr, "loka: %s\n", error.what());
    return Code(ExitStatus::kPort);
  }
}
