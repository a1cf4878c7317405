// SPDX-License-Identifier: Apache-2.0
#include "host/control/AttachedInstance.h"

#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <nlohmann/json.hpp>
#include <system_error>

#include "host/control/ControlPath.h"
#include "host/control/PeerUser.h"
#include "host/events/EventJson.h"
#include "host/events/EventSink.h"
#include "host/events/JsonLine.h"

namespace {

using Json = nlohmann::json;

constexpr std::size_t kMaxReplyLineBytes = std::size_t{16} * 1024 * 1024;
// Long enough for a request that waits for a port with the longest usual gap.
constexpr int kAnswerLimitMs = 60 * 1000;

int ConnectTo(const std::string& path, std::string* error) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (path.size() >= sizeof address.sun_path) {
    *error = path + " is too long for a socket";
    return -1;
  }
  std::memcpy(address.sun_path, path.c_str(), path.size() + 1);
  const int descriptor = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
  if (descriptor < 0 ||
      connect(descriptor, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) {
    *error = path + ": " + std::generic_category().message(errno);
    if (descriptor >= 0) {
      (void)close(descriptor);
    }
    return -1;
  }
  if (!IsPeerTrusted(descriptor)) {
    *error = path + " belongs to another user";
    (void)close(descriptor);
    return -1;
  }
  return descriptor;
}

}  // namespace

std::unique_ptr<AttachedInstance> AttachedInstance::Connect(const std::string& instanceName,
                                                            std::string* error) {
  const int descriptor = ConnectTo(ControlPath(instanceName), error);
  if (descriptor < 0) {
    return nullptr;
  }
  std::unique_ptr<AttachedInstance> instance(new AttachedInstance(descriptor));
  instance->info_ = instance->Call({{"op", "info"}});
  const Json& data = instance->Info();
  if (!instance->info_.IsDone() || !data.contains("port") || !data["port"].is_string()) {
    *error = instance->info_.IsDone() ? "no instance answers there" : instance->info_.text;
    return nullptr;
  }
  instance->port_ = data["port"].get<std::string>();
  return instance;
}

AttachedInstance::AttachedInstance(int descriptor)
    : descriptor_(descriptor), input_(kMaxReplyLineBytes), signals_([this](int signalNumber) {
        int none = 0;
        (void)stopSignal_.compare_exchange_strong(none, signalNumber);
        stop_.Raise();
      }) {}

AttachedInstance::~AttachedInstance() { (void)close(descriptor_); }

bool AttachedInstance::SendLine(const std::string& line) const {
  const std::string bytes = line + "\n";
  std::size_t sent = 0;
  while (sent < bytes.size()) {
    const ssize_t count = send(descriptor_, bytes.data() + sent, bytes.size() - sent, MSG_NOSIGNAL);
    if (count < 0 && errno == EINTR) {
      continue;
    }
    if (count <= 0) {
      return false;
    }
    sent += static_cast<std::size_t>(count);
  }
  return true;
}

// `wakes`: a call of Wake ends the wait.
AttachedInstance::Received AttachedInstance::ReceiveLine(const Deadline& deadline, bool wakes,
                                                         std::string* line) {
  while (!input_.Next(line)) {
    std::array<pollfd, 3> waits = {{{descriptor_, POLLIN, 0},
                                    {stop_.FileDescriptor(), POLLIN, 0},
                                    {wake_.FileDescriptor(), POLLIN, 0}}};
    const int ready = deadline.Poll(waits.data(), wakes ? waits.size() : waits.size() - 1);
    if (ready == 0) {
      return Received::kTimeout;
    }
    if ((waits[1].revents & POLLIN) != 0) {
      return Received::kStop;
    }
    if ((waits[2].revents & POLLIN) != 0) {
      wake_.Clear();
      return Received::kWoken;
    }
    std::array<char, 65536> bytes{};
    const ssize_t count = recv(descriptor_, bytes.data(), bytes.size(), 0);
    if (count < 0 && errno == EINTR) {
      continue;
    }
    if (count <= 0 ||
        !input_.Append(std::string_view(bytes.data(), static_cast<std::size_t>(count)))) {
      return Received::kGone;
    }
  }
  return Received::kLine;
}

Answer AttachedInstance::Call(const Json& request) {
  Json numbered = request;
  numbered["id"] = ++lastId_;
  if (!SendLine(JsonLine(numbered))) {
    return Refusal("the running instance is gone", ExitStatus::kPortLost);
  }
  const Deadline deadline = Deadline::After(kAnswerLimitMs);
  std::string line;
  for (;;) {
    const Received received = ReceiveLine(deadline, false, &line);
    if (received == Received::kStop) {
      return Refusal("", ExitStatus::kPortLost);
    }
    if (received != Received::kLine) {
      return Refusal(received == Received::kTimeout ? "the running instance does not answer"
                                                    : "the running instance is gone",
                     ExitStatus::kPortLost);
    }
    const Json json = Json::parse(line, nullptr, false);
    HostEvent event;
    Answer answer;
    if (FromJson(json, &event)) {
      events_.push_back(event);
    } else if (FromJson(json, &answer) && json.contains("id") && json["id"] == lastId_) {
      return answer;
    }
  }
}

Answer AttachedInstance::Subscribe() {
  if (isSubscribed_) {
    return {};
  }
  Answer answer = Call({{"op", "subscribe"}});
  isSubscribed_ = answer.IsDone();
  HostEvent head;
  if (isSubscribed_ && FromJson(answer.data.value("head", Json()), &head) && events_.empty()) {
    events_.push_front(head);
  }
  return answer;
}

Answer AttachedInstance::Serve(EventSink* sink, const std::function<bool()>& isDone,
                               const Deadline& deadline) {
  Answer subscribed = Subscribe();
  if (!subscribed.IsDone()) {
    return subscribed;
  }
  std::string line;
  while (!isDone()) {
    if (!events_.empty()) {
      const HostEvent event = events_.front();
      events_.pop_front();
      sink->OnEvent(event);
      continue;
    }
    HostEvent event;
    switch (ReceiveLine(deadline, true, &line)) {
      case Received::kLine:
        if (FromJson(Json::parse(line, nullptr, false), &event)) {
          events_.push_back(event);
        }
        break;
      case Received::kTimeout:
        return Refusal("", ExitStatus::kTimeout);
      case Received::kGone:
        return Refusal("the running instance has ended", ExitStatus::kPortLost);
      case Received::kStop:
        return {};
      case Received::kWoken:
        break;
    }
  }
  return {};
}
