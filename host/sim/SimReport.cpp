// SPDX-License-Identifier: Apache-2.0
#include "host/sim/SimReport.h"

#include <cstdio>
#include <nlohmann/json.hpp>

#include "host/events/JsonLine.h"
#include "host/events/WallClock.h"
#include "host/text/ByteText.h"

namespace {

using Json = nlohmann::ordered_json;

Json NewObject(const char* kind, std::int64_t timeUs) {
  Json json;
  json["t"] = UtcText(timeUs);
  json["ev"] = kind;
  return json;
}

// Flushed line by line, so that a reader sees each at once.
void Print(const std::string& line) {
  (void)std::printf("%s\n", line.c_str());
  (void)std::fflush(stdout);
}

void Tell(const std::string& text) { (void)std::fprintf(stderr, "loka: %s\n", text.c_str()); }

}  // namespace

void SimReport::OnPort(const std::string& state, const std::string& path, const std::string& link) {
  if (isJson_) {
    Json json = NewObject("port", WallClockUs());
    json["state"] = state;
    if (!path.empty()) {
      json["path"] = path;
    }
    if (!link.empty()) {
      json["link"] = link;
    }
    Print(JsonLine(json));
  } else if (isFirstPort_) {
    Print(path);
  } else {
    Tell(path.empty() ? state : state + ": " + path);
  }
  isFirstPort_ = false;
}

void SimReport::OnSent(const SentMessage& message, const std::string& whyLost,
                       std::int64_t timeUs) {
  sent_ += message.message.isVerbatim ? 0U : 1U;
  faulty_ += message.faults.empty() ? 0U : 1U;
  lostMessages_ += message.lostBytes > 0 ? 1U : 0U;
  lostBytes_ += message.lostBytes;
  if (!isJson_) {
    return;
  }
  Json json = NewObject("sent", timeUs);
  json["n"] = message.number;
  json["what"] = message.message.what;
  json["text"] = message.message.body;
  json["hex"] = CompactHex(message.message.body);
  json["fault"] = message.faults;
  json["wire"] = CompactHex(message.wire);
  json["lost"] = message.lostBytes;
  if (message.lostBytes > 0) {
    json["why"] = whyLost;
  }
  Print(JsonLine(json));
}

void SimReport::OnReceived(const DeviceInput& input) {
  ++received_;
  if (isJson_) {
    Json json = NewObject("received", WallClockUs());
    json["n"] = received_;
    json["what"] = input.what;
    json["text"] = input.bytes;
    json["hex"] = CompactHex(input.bytes);
    Print(JsonLine(json));
  } else if (input.what == "label") {
    Print("label  " + std::to_string(input.bytes.size()) + " bytes  \"" + EscapeBytes(input.bytes) +
          "\"");
  } else {
    Tell(input.what + ": \"" + EscapeBytes(input.bytes) + "\"");
  }
}

void SimReport::OnEnd(std::uint64_t missedIntervals) const {
  if (isJson_) {
    Json json = NewObject("end", WallClockUs());
    json["sent"] = sent_;
    json["faulty"] = faulty_;
    json["lost"] = lostMessages_;
    json["lost_bytes"] = lostBytes_;
    json["received"] = received_;
    json["missed"] = missedIntervals;
    Print(JsonLine(json));
  }
  Tell("sent " + std::to_string(sent_) + " messages, " + std::to_string(faulty_) +
       " with a fault, " + std::to_string(lostMessages_) + " lost or in part (" +
       std::to_string(lostBytes_) + " bytes); received " + std::to_string(received_) +
       "; intervals missed " + std::to_string(missedIntervals));
}
