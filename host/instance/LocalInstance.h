// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <memory>
#include <mutex>
#include <string>

#include "host/base/SignalWatch.h"
#include "host/control/ControlServer.h"
#include "host/events/EventStream.h"
#include "host/events/Statistics.h"
#include "host/instance/Instance.h"
#include "host/instance/InstanceOptions.h"
#include "host/instance/LineIntake.h"
#include "host/instance/Requests.h"
#include "host/instance/TokenPump.h"
#include "host/runtime/HostSession.h"

// A driver that this process runs. One thread opens, calls and serves; a control server answers
// other processes meanwhile.
class LocalInstance final : public Instance {
 public:
  struct Options {
    InstanceOptions instance;
    bool acknowledges = true;  // tokens are taken as they are served
    bool connects = true;      // opens the port even where the configuration leaves it closed
  };

  // Loads, configures, starts and connects. Null with the reason in `answer`.
  static std::unique_ptr<LocalInstance> Open(const Options& options, Answer* answer);

  ~LocalInstance() override;

  LocalInstance(const LocalInstance&) = delete;
  LocalInstance& operator=(const LocalInstance&) = delete;

  Answer Call(const nlohmann::json& request) override;
  Answer Subscribe() override;
  Answer Serve(EventSink* sink, const std::function<bool()>& isDone,
               const Deadline& deadline) override;
  void Wake() override { intake_.Wake(); }
  std::string Port() const override { return events_.Port(); }
  int StopSignal() const override { return intake_.StopSignal(); }

  // Lets other processes attach under the port's name. False with the reason in `error`.
  bool Share(std::string* error);

  // For what the user is told at the start.
  HostSession* Session() { return &session_; }
  EventStream* Events() { return &events_; }

 private:
  LocalInstance(const Options& options, const HostOptions& host);

  Answer Start(const Options& options);
  Answer Connect();
  Answer HandleShared(const nlohmann::json& request);
  std::unique_lock<std::mutex> LockDriver();
  Answer Pump(const Deadline& deadline, const std::function<bool()>& isDone);

  LineIntake intake_;
  SignalWatch signals_;  // in front of everything that starts threads
  EventStream events_;
  Statistics statistics_;
  HostSession session_;
  std::unique_ptr<Requests> requests_;
  std::unique_ptr<TokenPump> pump_;
  std::unique_ptr<ControlServer> server_;
};
