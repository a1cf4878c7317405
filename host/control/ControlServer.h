// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <cstddef>
#include <functional>
#include <list>
#include <memory>
#include <mutex>
#include <nlohmann/json_fwd.hpp>
#include <optional>
#include <string>
#include <thread>

#include "host/base/Deadline.h"
#include "host/control/LineBuffer.h"
#include "host/events/EventSink.h"
#include "host/instance/Answer.h"
#include "host/port/EventSignal.h"

// The control socket of a running instance. Each line of a client is a request, a JSON object; each
// gets one line with the answer, in order, under the request's "id". The request {"op":"subscribe"}
// makes events come in between, as EventJson writes them. An "id" is a number or a text; any other
// is left out. The socket lets in its own user only.
//
// A client that does not read loses events, never answers, and is told how many; its requests wait
// once too many answers do. The instance never waits for a client.
class ControlServer final : public EventSink {
 public:
  using Handler = std::function<Answer(const nlohmann::json& request)>;

  // Listens under the name. Null, with the reason in `error`, when the folder cannot be made or
  // another process answers under that name; what an ended process left behind is replaced. The
  // handler is called on the server's thread.
  static std::unique_ptr<ControlServer> Listen(const std::string& instanceName, Handler handler,
                                               std::string* error);

  // Closes the connections and removes the socket.
  ~ControlServer() override;

  ControlServer(const ControlServer&) = delete;
  ControlServer& operator=(const ControlServer&) = delete;

  // Any thread.
  void OnEvent(const HostEvent& event) override;

 private:
  struct Client;

  ControlServer(std::string path, int listenDescriptor, int lockDescriptor, Handler handler);

  void Run();
  void Accept();
  bool Read(Client* client);
  void HandleLine(Client* client, const std::string& line);
  Answer Carry(const nlohmann::json& request) const;
  static bool Flush(Client* client);
  static void TellMissed(Client* client);

  const std::string path_;
  const int listenDescriptor_;
  const int lockDescriptor_;
  const EventSignal wake_;
  const Handler handler_;
  std::atomic<bool> isEnding_{false};

  // Guards the clients' outgoing bytes and whether they listen to events.
  std::mutex mutex_;
  std::list<Client> clients_;
  std::optional<Deadline> acceptPause_;  // used on the server's thread only
  std::thread thread_;
};
