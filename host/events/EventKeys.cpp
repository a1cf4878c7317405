// SPDX-License-Identifier: Apache-2.0
#include "host/events/EventKeys.h"

#include <nlohmann/json.hpp>
#include <stdexcept>

#include "host/events/EventJson.h"

namespace {

constexpr bool kOptional = true;

std::vector<EventKind> MakeKinds() {
  return {
      {"token",
       "a token is the oldest one in the queue",
       {{"n", "counts the tokens from 1 since the instance was started", "17"},
        {"len", "its bytes", "9"},
        {"text", "for reading; bytes that are not UTF-8 are replaced", R"("ST,GS+5.1")"},
        {"hex", "exactly", R"("53542C47532B352E31")"},
        {"waiting", "tokens in the queue, this one included", "1"},
        {"dur_us", "microseconds from the frame's first to its last byte", "11458", kOptional},
        {"cut", "true: only what stands in front of a zero byte is known", "true", kOptional},
        {"frame", "as it came, prefix and suffix included", R"("0253542C47532B352E3103")",
         kOptional},
        {"prefix_len", "bytes of the frame that are its prefix", "1", kOptional},
        {"suffix_len", "bytes of the frame that are its suffix", "1", kOptional}}},
      {"label",
       "bytes of a token, and what they are in its frame (with -vv)",
       {{"role", "prefix, body, suffix", R"("suffix")"}, {"hex", "the bytes", R"("03")"}}},
      {"drop",
       "bytes that became no part of a token",
       {{"why", "no-suffix, partial-prefix, over-1000, queue-full and the like", R"("no-suffix")"},
        {"after_ms", "the silence that ended them", "500", kOptional},
        {"hex", "the bytes", R"("53542C")"}}},
      {"rx", "bytes that the driver took from the line", {{"hex", "the bytes", R"("0253542C")"}}},
      {"tx",
       "bytes that went out",
       {{"hex", "the bytes", R"("520D0A")"}, {"sent", "how many of them the line took", "3"}}},
      {"port",
       "the port was opened, lost, came back or was closed",
       {{"state", "open, lost, back, closed", R"("lost")"},
        {"errno", "the name of the system's error", R"("EIO")", kOptional},
        {"text", "why, for people", R"("...")"}}},
      {"setting",
       "a run-time setting changed",
       {{"state", "staged, applied, stored", R"("applied")"},
        {"key", "its name", R"("baud")"},
        {"value", "its value", R"("19200")"},
        {"previous", "the value in effect before", R"("9600")", kOptional}}},
      {"console",
       "a console command was run",
       {{"command", "the command", R"("get_stat")"},
        {"ok", "whether the driver did it", "true"},
        {"text", "its reply", R"("Connected")"}}},
      {"note", "something to know", {{"text", "for people", R"("...")"}}},
      {"finding",
       "the driver's token and the host's own reading of the same bytes differ",
       {{"text", "for people", R"("...")"},
        {"driver", "the driver's bytes", R"("41")"},
        {"model", "the host's", R"("4142")"}}}};
}

}  // namespace

const std::vector<EventKind>& EventKinds() {
  static const std::vector<EventKind> kKinds = MakeKinds();
  return kKinds;
}

std::string ExampleLine(const EventKind& kind) {
  nlohmann::json json = {{"t", "2026-11-21T09:12:03.123456Z"}, {"ev", kind.name}, {"port", "com1"}};
  for (const EventKey& key : kind.keys) {
    json[key.name] = nlohmann::json::parse(key.example);
  }
  HostEvent event;
  if (!FromJson(json, &event)) {
    throw std::logic_error(std::string("the examples of ") + kind.name + " make no event");
  }
  return ToJsonLine(event);
}
