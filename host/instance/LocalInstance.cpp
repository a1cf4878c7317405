// SPDX-License-Identifier: Apache-2.0
#include "host/instance/LocalInstance.h"

#include <utility>

#include "host/events/EventJson.h"
#include "host/events/EventSink.h"
#include "host/events/WallClock.h"
#include "host/port/PortAdvice.h"
#include "host/text/ByteText.h"

namespace {

constexpr int kLineWaitStepMs = 5;
constexpr int kTurnOfOthersMs = 1;
constexpr std::size_t kMaxRecordsAtOnce = 100;

Answer AnswerOf(const HostResult& result, bool hasStore) {
  Answer answer = Refusal(result.text, result.status);
  if (result.status == ExitStatus::kPort) {
    answer.hints = AdviceFor(result.problem);
  } else if (result.status == ExitStatus::kRefused && hasStore) {
    answer.hints.emplace_back("--no-store goes on without stored settings");
  }
  return answer;
}

HostOptions WithObserver(HostOptions host, PortObserver* observer) {
  host.observer = observer;
  return host;
}

// Hands events to a sink for as long as a call lasts.
class Listening {
 public:
  Listening(EventStream* events, EventSink* sink) : events_(events), sink_(sink) {
    events_->Add(sink_);
  }
  ~Listening() { events_->Remove(sink_); }
  Listening(const Listening&) = delete;
  Listening& operator=(const Listening&) = delete;

 private:
  EventStream* const events_;
  EventSink* const sink_;
};

}  // namespace

LocalInstance::LocalInstance(const Options& options, const HostOptions& host)
    : signals_([this](int signalNumber) { intake_.RequestStop(signalNumber); }),
      events_(options.instance.PortName()),
      session_(WithObserver(host, &intake_)) {
  events_.Add(&statistics_);
}

LocalInstance::~LocalInstance() {
  // The clients first, then the driver whose requests they make.
  if (server_ != nullptr) {
    events_.Remove(server_.get());
    server_.reset();
  }
  session_.Stop();
  pump_.reset();
}

std::unique_ptr<LocalInstance> LocalInstance::Open(const Options& options, Answer* answer) {
  HostOptions host;
  std::string error;
  if (!MakeHostOptions(options.instance, &host, &error)) {
    *answer = Refusal(error, ExitStatus::kUsage);
    return nullptr;
  }
  std::unique_ptr<LocalInstance> instance(new LocalInstance(options, host));
  *answer = instance->Start(options);
  return answer->IsDone() ? std::move(instance) : nullptr;
}

Answer LocalInstance::Start(const Options& options) {
  const bool hasStore = !options.instance.withoutStore;
  HostResult result = session_.Open();
  if (result.IsDone()) {
    result = session_.Configure(options.instance.configuration);
  }
  if (result.status == ExitStatus::kConfiguration) {
    Answer answer = AnswerOf(result, hasStore);
    answer.hints.push_back("the driver rejects the configuration: " +
                           EscapeBytes(options.instance.configuration));
    return answer;
  }
  if (result.IsDone()) {
    result = session_.Start();
  }
  if (!result.IsDone()) {
    return AnswerOf(result, hasStore);
  }
  Requests::Info info;
  info.path = session_.PathOf(options.instance.PortName());
  info.configuration = options.instance.configuration;
  info.storeFile = session_.StoreFile();
  info.acknowledges = options.acknowledges;
  requests_ = std::make_unique<Requests>(&session_, &events_, &statistics_, std::move(info));
  requests_->ReadActiveSettings();
  pump_ = std::make_unique<TokenPump>(&session_, &events_, requests_.get(), options.acknowledges);
  requests_->OnDeleteTags([this] { pump_->GiveTagsBack(); });
  return options.connects ? Connect() : Answer();
}

// A configuration may leave the port closed at the start; a command that reads or sends wants it
// open.
Answer LocalInstance::Connect() { return Call({{"op", "connect"}, {"state", "on"}}); }

bool LocalInstance::Share(std::string* error) {
  server_ = ControlServer::Listen(
      Port(), [this](const nlohmann::json& request) { return HandleShared(request); }, error);
  if (server_ == nullptr) {
    return false;
  }
  events_.Add(server_.get());
  return true;
}

Answer LocalInstance::Call(const nlohmann::json& request) { return requests_->Handle(request); }

// Serve hands on whatever the line brought since the start.
Answer LocalInstance::Subscribe() { return {}; }

// Of another process, on the server's thread.
Answer LocalInstance::HandleShared(const nlohmann::json& request) {
  if (!request.contains("op") || request["op"] != "subscribe") {
    Answer answer = requests_->Handle(request);
    intake_.Wake();  // another token may be the oldest one now
    return answer;
  }
  // Who comes late has not seen the oldest token being published.
  Answer answer;
  const std::lock_guard<std::mutex> lock(requests_->DriverMutex());
  const std::optional<TokenReceived> head = pump_->Head();
  if (head) {
    answer.data["head"] = ToJson(HostEvent{WallClockUs(), Port(), *head});
  }
  return answer;
}

// Who has just let go of a mutex usually gets it again; the others must get their turn.
std::unique_lock<std::mutex> LocalInstance::LockDriver() {
  if (requests_->IsAnybodyWaiting()) {
    Deadline::After(kTurnOfOthersMs).Sleep();
  }
  return std::unique_lock<std::mutex>(requests_->DriverMutex());
}

Answer LocalInstance::Pump(const Deadline& deadline, const std::function<bool()>& isDone) {
  Deadline wait = deadline;
  if (pump_->IsWaitingForLine() || pump_->HasMore()) {
    wait = Deadline::Earlier(deadline, Deadline::After(pump_->HasMore() ? 0 : kLineWaitStepMs));
  }
  std::vector<LineRecord> records;
  for (LineRecord& record : intake_.Take(wait)) {
    // Much that came at once is worked off in parts, so that others can call the driver in between.
    if (records.size() == kMaxRecordsAtOnce && StopSignal() == 0) {
      const auto lock = LockDriver();
      pump_->Follow(records);
      records.clear();
    }
    records.push_back(std::move(record));
  }
  const auto lock = LockDriver();
  return pump_->Run(records, isDone);
}

Answer LocalInstance::Serve(EventSink* sink, const std::function<bool()>& isDone,
                            const Deadline& deadline) {
  const Listening listening(&events_, sink);
  while (!isDone()) {
    if (StopSignal() != 0) {
      return {};
    }
    if (deadline.HasPassed()) {
      return Refusal("", ExitStatus::kTimeout);
    }
    // A device that never pauses must not keep a signal waiting.
    Answer answer = Pump(deadline, [&] { return isDone() || StopSignal() != 0; });
    if (answer.IsDone() && session_.IsPortGone(Port())) {
      answer = Refusal("the line is lost and reconnect=off", ExitStatus::kPortLost);
    }
    if (!answer.IsDone()) {
      return answer;
    }
  }
  return {};
}
