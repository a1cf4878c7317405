// SPDX-License-Identifier: Apache-2.0
#include "host/control/ControlServer.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <exception>
#include <nlohmann/json.hpp>
#include <system_error>
#include <utility>
#include <vector>

#include "host/base/SystemError.h"
#include "host/control/ControlPath.h"
#include "host/control/PeerUser.h"
#include "host/events/EventJson.h"
#include "host/events/JsonLine.h"
#include "host/events/WallClock.h"
#include "host/text/Output.h"

namespace {

using Json = nlohmann::json;

constexpr std::size_t kMaxRequestBytes = std::size_t{1024} * 1024;
constexpr std::size_t kMaxWaitingBytes = std::size_t{1024} * 1024;  // of events, for one client
constexpr int kBacklog = 16;
constexpr int kAcceptPauseMs = 200;  // where there is no descriptor for another client
constexpr std::size_t kMaxClients = 64;

bool MakeAddress(const std::string& path, sockaddr_un* address, std::string* error) {
  *address = {};
  address->sun_family = AF_UNIX;
  if (path.size() >= sizeof address->sun_path) {
    *error = path + " is too long for a socket";
    return false;
  }
  std::memcpy(address->sun_path, path.c_str(), path.size() + 1);
  return true;
}

int Listening(const std::string& path, std::string* error) {
  sockaddr_un address{};
  if (!MakeAddress(path, &address, error)) {
    return -1;
  }
  const int descriptor = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
  if (descriptor < 0) {
    *error = SystemErrorText(errno);
    return -1;
  }
  (void)unlink(path.c_str());
  // The folder keeps others out; the mode of the socket does so once more.
  const mode_t formerMask = umask(S_IXUSR | S_IRWXG | S_IRWXO);
  const bool isBound =
      bind(descriptor, reinterpret_cast<const sockaddr*>(&address), sizeof address) == 0;
  (void)umask(formerMask);
  if (!isBound || listen(descriptor, kBacklog) != 0) {
    *error = path + ": " + SystemErrorText(errno);
    (void)close(descriptor);
    return -1;
  }
  return descriptor;
}

// Held as long as the instance lives, so that its name is free as soon as it ends, however it ends.
int LockName(const std::string& path, std::string* error) {
  const std::string lockPath = path + ".lock";
  const int descriptor = open(lockPath.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600);
  if (descriptor < 0) {
    *error = lockPath + ": " + SystemErrorText(errno);
    return -1;
  }
  if (flock(descriptor, LOCK_EX | LOCK_NB) != 0) {
    *error = "another instance of this name is running (" + path + ")";
    (void)close(descriptor);
    return -1;
  }
  return descriptor;
}

}  // namespace

struct ControlServer::Client {
  explicit Client(int fileDescriptor) : descriptor(fileDescriptor) {}
  ~Client() { (void)close(descriptor); }
  Client(const Client&) = delete;
  Client& operator=(const Client&) = delete;

  const int descriptor;
  LineBuffer input{kMaxRequestBytes};
  std::string output;
  bool isSubscribed = false;
  std::uint64_t missedEvents = 0;
  std::string missedPort;
  bool isGone = false;
};

std::unique_ptr<ControlServer> ControlServer::Listen(const std::string& instanceName,
                                                     Handler handler, std::string* error) {
  if (!MakeControlFolder(error)) {
    return nullptr;
  }
  const std::string path = ControlPath(instanceName);
  const int lockDescriptor = LockName(path, error);
  if (lockDescriptor < 0) {
    return nullptr;
  }
  const int listenDescriptor = Listening(path, error);
  if (listenDescriptor < 0) {
    (void)close(lockDescriptor);
    return nullptr;
  }
  return std::unique_ptr<ControlServer>(
      new ControlServer(path, listenDescriptor, lockDescriptor, std::move(handler)));
}

ControlServer::ControlServer(std::string path, int listenDescriptor, int lockDescriptor,
                             Handler handler)
    : path_(std::move(path)),
      listenDescriptor_(listenDescriptor),
      lockDescriptor_(lockDescriptor),
      handler_(std::move(handler)),
      thread_([this] { Run(); }) {}

ControlServer::~ControlServer() {
  isEnding_.store(true);
  wake_.Raise();
  thread_.join();
  (void)unlink(path_.c_str());
  (void)close(listenDescriptor_);
  (void)close(lockDescriptor_);
}

void ControlServer::OnEvent(const HostEvent& event) {
  const std::lock_guard<std::mutex> lock(mutex_);
  std::string line;
  for (Client& client : clients_) {
    if (!client.isSubscribed) {
      continue;
    }
    if (client.output.size() > kMaxWaitingBytes) {
      ++client.missedEvents;
      client.missedPort = event.port;
      continue;
    }
    if (line.empty()) {
      line = ToJsonLine(event) + "\n";
    }
    TellMissed(&client);
    client.output += line;
  }
  if (!line.empty()) {
    wake_.Raise();
  }
}

// With the lock held. Whoever reads again must not have to wait for the next event to know.
void ControlServer::TellMissed(Client* client) {
  if (client->missedEvents == 0) {
    return;
  }
  const HostEvent note{
      WallClockUs(), client->missedPort,
      NoteMade{std::to_string(client->missedEvents) + " events were not read in time"}};
  client->output += ToJsonLine(note) + "\n";
  client->missedEvents = 0;
}

void ControlServer::Run() {
  while (!isEnding_.load()) {
    const bool isAccepting = !acceptPause_ || acceptPause_->HasPassed();
    // A negative descriptor is left out (poll(2)).
    std::vector<pollfd> waits = {{isAccepting ? listenDescriptor_ : -1, POLLIN, 0},
                                 {wake_.FileDescriptor(), POLLIN, 0}};
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      clients_.remove_if([](const Client& client) { return client.isGone; });
      for (const Client& client : clients_) {
        // Who does not fetch answers asks for no more of them.
        const int input = client.output.size() > kMaxWaitingBytes ? 0 : POLLIN;
        const int output = client.output.empty() ? 0 : POLLOUT;
        waits.push_back({client.descriptor, static_cast<short>(input | output), 0});
      }
    }
    const int limitMs = isAccepting ? -1 : acceptPause_->RemainingMs();
    if (poll(waits.data(), waits.size(), limitMs) < 0 && errno != EINTR) {
      return;
    }
    wake_.Clear();
    // Only this thread adds and removes clients, so the order still holds.
    std::size_t index = 2;
    for (Client& client : clients_) {
      const short happened = waits[index++].revents;
      if ((happened & (POLLIN | POLLHUP | POLLERR)) != 0) {
        client.isGone = !Read(&client);
      }
      if (!client.isGone) {
        const std::lock_guard<std::mutex> lock(mutex_);
        client.isGone = !Flush(&client);
        if (client.output.empty()) {
          TellMissed(&client);
        }
      }
    }
    if ((waits[0].revents & POLLIN) != 0) {
      Accept();
    }
  }
}

void ControlServer::Accept() {
  const int descriptor = accept4(listenDescriptor_, nullptr, nullptr, SOCK_CLOEXEC | SOCK_NONBLOCK);
  if (descriptor < 0) {
    // Who wants in stays in the queue, so asking again at once would never end.
    const bool isGone = errno == EAGAIN || errno == ECONNABORTED || errno == EINTR;
    if (!isGone && !acceptPause_) {
      TellUser("nobody else can attach for now: " + SystemErrorText(errno));
    }
    if (!isGone) {
      acceptPause_ = Deadline::After(kAcceptPauseMs);
    }
    return;
  }
  acceptPause_.reset();
  const std::lock_guard<std::mutex> lock(mutex_);
  if (clients_.size() >= kMaxClients || !IsPeerTrusted(descriptor)) {
    (void)close(descriptor);
    return;
  }
  clients_.emplace_back(descriptor);
}

// False when the client is gone or does not keep to the rules.
bool ControlServer::Read(Client* client) {
  std::array<char, 16384> bytes{};
  const ssize_t count = recv(client->descriptor, bytes.data(), bytes.size(), 0);
  if (count == 0 || (count < 0 && errno != EAGAIN && errno != EINTR)) {
    return false;
  }
  if (count < 0) {
    return true;
  }
  if (!client->input.Append(std::string_view(bytes.data(), static_cast<std::size_t>(count)))) {
    return false;
  }
  std::string line;
  while (client->input.Next(&line)) {
    HandleLine(client, line);
  }
  return true;
}

// A request can be anything, and nothing in it may end the instance.
Answer ControlServer::Carry(const Json& request) const {
  try {
    return handler_(request);
  } catch (const std::exception& error) {
    return Refusal(std::string("the request cannot be carried out: ") + error.what(),
                   ExitStatus::kUsage);
  }
}

void ControlServer::HandleLine(Client* client, const std::string& line) {
  const Json request = Json::parse(line, nullptr, false);
  if (request.is_object() && request.contains("op") && request["op"] == "subscribe") {
    // Before the handler says what was published last, so that no event falls in between.
    const std::lock_guard<std::mutex> lock(mutex_);
    client->isSubscribed = true;
  }
  const Answer answer = request.is_object()
                            ? Carry(request)
                            : Refusal("expected one JSON object a line", ExitStatus::kUsage);
  Json reply = ToJson(answer);
  if (request.is_object() && request.contains("id") &&
      (request["id"].is_number() || request["id"].is_string())) {
    reply["id"] = request["id"];
  }
  const std::lock_guard<std::mutex> lock(mutex_);
  client->output += JsonLine(reply) + "\n";
}

// With the lock held.
bool ControlServer::Flush(Client* client) {
  while (!client->output.empty()) {
    const ssize_t count = send(client->descriptor, client->output.data(), client->output.size(),
                               MSG_NOSIGNAL | MSG_DONTWAIT);
    if (count < 0) {
      return errno == EAGAIN || errno == EINTR;
    }
    client->output.erase(0, static_cast<std::size_t>(count));
  }
  return true;
}
