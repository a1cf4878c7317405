// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <cstdint>
#include <deque>
#include <memory>
#include <string>

#include "host/base/SignalWatch.h"
#include "host/control/LineBuffer.h"
#include "host/events/HostEvent.h"
#include "host/instance/Instance.h"
#include "host/port/EventSignal.h"

// The instance of another process, reached through its control socket. One thread.
class AttachedInstance final : public Instance {
 public:
  // Connects to the instance of that name. Null, with the reason in `error`, when nobody answers
  // there or when the one who listens is of another user.
  static std::unique_ptr<AttachedInstance> Connect(const std::string& instanceName,
                                                   std::string* error);

  ~AttachedInstance() override;

  AttachedInstance(const AttachedInstance&) = delete;
  AttachedInstance& operator=(const AttachedInstance&) = delete;

  Answer Call(const nlohmann::json& request) override;
  Answer Subscribe() override;
  Answer Serve(EventSink* sink, const std::function<bool()>& isDone,
               const Deadline& deadline) override;
  void Wake() override { wake_.Raise(); }
  std::string Port() const override { return port_; }

  // What the instance said about itself: the data of the request "info".
  const nlohmann::json& Info() const { return info_.data; }

  int StopSignal() const override { return stopSignal_; }

 private:
  explicit AttachedInstance(int descriptor);

  bool SendLine(const std::string& line) const;
  enum class Received { kLine, kTimeout, kGone, kStop, kWoken };
  Received ReceiveLine(const Deadline& deadline, bool wakes, std::string* line);

  const int descriptor_;
  EventSignal stop_;  // raised once a signal asked to stop
  EventSignal wake_;  // raised until Serve has seen it
  std::string port_;
  Answer info_;
  LineBuffer input_;
  std::deque<HostEvent> events_;  // came while an answer was waited for
  std::uint64_t lastId_ = 0;
  bool isSubscribed_ = false;
  std::atomic<int> stopSignal_{0};
  SignalWatch signals_;
};
