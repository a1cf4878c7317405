// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <nlohmann/json_fwd.hpp>
#include <string>

#include "host/base/Deadline.h"
#include "host/instance/Answer.h"

class EventSink;

// A running driver that commands talk to: one that this process started (LocalInstance), or the one
// of another process that owns the port (AttachedInstance). Both answer the same requests, which
// Requests.h lists.
class Instance {
 public:
  virtual ~Instance() = default;

  // Carries out one request, {"op": ..., ...}. Waits for the answer. One thread.
  virtual Answer Call(const nlohmann::json& request) = 0;

  // Keeps events for Serve from now on.
  virtual Answer Subscribe() = 0;

  // Hands on events until isDone says so, asked after every event, the deadline passes, the process
  // is asked to stop or the instance is gone. Tokens are taken only here, so a command that does
  // not serve leaves them in the queue. One thread, the one that calls Call.
  virtual Answer Serve(EventSink* sink, const std::function<bool()>& isDone,
                       const Deadline& deadline) = 0;

  // Makes Serve ask isDone now, or once when it is called next. Any thread.
  virtual void Wake() = 0;

  // The port's name in the configuration, "com1".
  virtual std::string Port() const = 0;

  // The signal that asked to stop, or 0.
  virtual int StopSignal() const = 0;
};
