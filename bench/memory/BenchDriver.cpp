// SPDX-License-Identifier: Apache-2.0
// The driver in memory: bytes, tags, settings, console, and how each grows. Names are
// QUESTION/CASE or QUESTION/NUMBER; "per" is what one iteration holds of what the question counts
// in (bytes, tags), "allocations" counts those of one iteration.
#include <benchmark/benchmark.h>

#include <array>
#include <memory>
#include <string>
#include <vector>

#include "bench/memory/Allocations.h"
#include "bench/memory/MemoryHost.h"
#include "bench/reader/ObligedLoop.h"
#include "driver/MemoryTypeCatalogue.h"
#include "driver/Protocol_LOKA.h"
#include "interfaces/ITag.h"

namespace {

constexpr const char* kMandatory =
    "CfgVer=1 model=1 port=com1 baudrate=115200 parity=none bits=8 stopbits=1 mode=RS-232 ";
constexpr const char* kFramed = "rx_prefix=02 rx_suffix=03 token_queue_size=100 ";

std::string Frame(std::size_t payload) { return "\x02" + std::string(payload, 'x') + "\x03"; }

// A started driver on a host in memory.
class Bench {
 public:
  explicit Bench(const std::string& configuration = kFramed)
      : protocol_(std::make_unique<Protocol_LOKA>()) {
    host_.Line().Play(Frame(16), false);
    isRunning_ =
        protocol_->Config((kMandatory + configuration).c_str()) != 0 && protocol_->Start() != 0;
  }

  // Ends the measurement when something did not work; a wrong figure would be worse than none.
  bool Check(benchmark::State& state, bool isDone) const {
    if (!isRunning_ || !isDone) {
      state.SkipWithError("the driver refused");
    }
    return isRunning_ && isDone;
  }

  Protocol_LOKA& Driver() { return *protocol_; }
  EndlessPort& Line() { return host_.Line(); }
  ITag* Tag(const std::string& uri) { return protocol_->CreateTag(uri.c_str()); }

 private:
  MemoryHost host_;
  std::unique_ptr<Protocol_LOKA> protocol_;
  bool isRunning_ = false;
};

// Counts the allocations of a measurement's iterations.
class Counted {
 public:
  Counted(benchmark::State& state, double per) : state_(state), per_(per) {}
  ~Counted() {
    const auto count = static_cast<double>(AllocationCount() - before_);
    state_.counters["allocations"] = count / static_cast<double>(state_.iterations());
    state_.counters["per"] = per_;
  }
  Counted(const Counted&) = delete;
  Counted& operator=(const Counted&) = delete;

 private:
  benchmark::State& state_;
  const double per_;
  const long long before_ = AllocationCount();
};

std::string HexOf(std::size_t bytes, const char* digits) {
  std::string text;
  for (std::size_t i = 0; i < bytes; ++i) {
    text += digits;
  }
  return text;
}

// --- received bytes ---

void MeasurePasses(benchmark::State& state, Bench& bench, const std::string& round,
                   bool hasSilence) {
  bench.Line().Play(round, hasSilence);
  for (int i = 0; i < 300; ++i) {
    bench.Driver().Task();
  }
  const Counted counted(state, static_cast<double>(round.size()));
  for (auto _ : state) {
    bench.Driver().Task();
  }
}

void Loop(benchmark::State& state, ObligedLoop::Compare compare) {
  EndlessPort line;
  line.Play(Frame(static_cast<std::size_t>(state.range(0))), false);
  const auto semaphore = MakeMutexSemaphore();
  ObligedLoop loop(&line, semaphore.get(), compare);
  const Counted counted(state, static_cast<double>(state.range(0) + 2));
  std::string_view token;
  for (auto _ : state) {
    benchmark::DoNotOptimize(loop.Next(&token));
  }
}

void BytesDriver(benchmark::State& state, const std::string& configuration, bool hasPrefix,
                 bool hasSuffix) {
  Bench bench(configuration + " token_queue_size=100");
  std::string round(static_cast<std::size_t>(state.range(0)), 'x');
  round = (hasPrefix ? "\x02" : "") + round + (hasSuffix ? "\x03" : "");
  MeasurePasses(state, bench, round, !hasSuffix);
}

void RegisterBytes() {
  for (const int length : {16, 202}) {
    benchmark::RegisterBenchmark("bytes/obliged loop, bare", Loop, ObligedLoop::Compare::kWholeTail)
        ->Arg(length);
    benchmark::RegisterBenchmark("bytes/obliged loop, lean", Loop,
                                 ObligedLoop::Compare::kLastByteFirst)
        ->Arg(length);
    benchmark::RegisterBenchmark("bytes/prefix and suffix", BytesDriver,
                                 "rx_prefix=02 rx_suffix=03", true, true)
        ->Arg(length);
    benchmark::RegisterBenchmark("bytes/prefix and suffix, hexadecimal", BytesDriver,
                                 "rx_prefix=02 rx_suffix=03 hex_tokens=true", true, true)
        ->Arg(length);
    benchmark::RegisterBenchmark("bytes/suffix only", BytesDriver, "rx_suffix=03", false, true)
        ->Arg(length);
    benchmark::RegisterBenchmark("bytes/prefix only", BytesDriver, "rx_prefix=02", true, false)
        ->Arg(length);
    benchmark::RegisterBenchmark("bytes/silence only", BytesDriver, "", false, false)->Arg(length);
  }
}

// --- tags ---

const char* TypeFor(const MemoryTypeRow& row) {
  switch (row.naturalType) {
    case ICU_BYTE:
      return "string-128";
    case ICU_UNSIGNED_INT:
      return "unsignedInt";
    case ICU_UNSIGNED_BYTE:
      return "unsignedByte";
    default:
      return "boolean";
  }
}

std::string UriOf(const MemoryTypeRow& row) {
  return std::string("0?") + row.name + "?" + TypeFor(row);
}

void ReadTag(benchmark::State& state, const std::string& uri) {
  Bench bench;
  bench.Driver().Task();
  std::array<unsigned char, 256> value{};
  const ITag* const tag = bench.Tag(uri);
  if (!bench.Check(state, tag != nullptr && bench.Driver().Read(tag, value.data()) != 0)) {
    return;
  }
  const Counted counted(state, 1);
  for (auto _ : state) {
    benchmark::DoNotOptimize(bench.Driver().Read(tag, value.data()));
  }
}

void WriteTag(benchmark::State& state, const std::string& uri, unsigned char first) {
  Bench bench;
  const std::array<unsigned char, 256> value{first};
  const ITag* const tag = bench.Tag(uri);
  if (!bench.Check(state, tag != nullptr && bench.Driver().Write(tag, value.data()) != 0)) {
    return;
  }
  const Counted counted(state, 1);
  for (auto _ : state) {
    benchmark::DoNotOptimize(bench.Driver().Write(tag, value.data()));
  }
}

// A token as a panel takes it: count, length, text, acknowledge.
void TakeToken(benchmark::State& state) {
  Bench bench;
  const ITag* const available = bench.Tag("0?tokens_available?unsignedInt");
  const ITag* const length = bench.Tag("0?rx_token_len?unsignedInt");
  const ITag* const token = bench.Tag("0?rx_token?string-128");
  const ITag* const acknowledge = bench.Tag("0?token_ack?boolean");
  std::array<unsigned char, 128> value{};
  const Counted counted(state, 1);
  for (auto _ : state) {
    bench.Driver().Task();
    bench.Driver().Read(available, value.data());
    bench.Driver().Read(length, value.data());
    bench.Driver().Read(token, value.data());
    value[0] = 1;
    bench.Driver().Write(acknowledge, value.data());
  }
}

void RegisterTags() {
  for (const MemoryTypeRow& row : kMemoryTypes) {
    benchmark::RegisterBenchmark((std::string("read/") + row.name).c_str(), ReadTag, UriOf(row));
  }
  benchmark::RegisterBenchmark("write/token_ack", WriteTag, "0?token_ack?boolean", 1);
  benchmark::RegisterBenchmark("write/tx_token", WriteTag, "0?tx_token?string-128", 'A');
  benchmark::RegisterBenchmark("write/SP_Gap", WriteTag, "0?SP_Gap?unsignedInt", 20);
  benchmark::RegisterBenchmark("write/SP_Done, nothing staged", WriteTag, "0?SP_Done?boolean", 1);
  benchmark::RegisterBenchmark("take/a token of 16 bytes", TakeToken);
}

// --- SP_Done and the console ---

void EverythingStaged(benchmark::State& state) {
  Bench bench;
  bool isStaged = true;
  const auto stage = [&](const char* uri, const std::string& bytes) {
    std::string value = bytes;
    value.resize(64);
    const ITag* const tag = bench.Tag(uri);
    isStaged = isStaged && tag != nullptr &&
               bench.Driver().Write(tag, reinterpret_cast<const unsigned char*>(value.data())) != 0;
  };
  stage("0?SP_Baud?unsignedInt", std::string("\x80\x25\0\0", 4));
  stage("0?SP_Bits?unsignedByte", "\x08");
  stage("0?SP_Stop?unsignedByte", "\x01");
  stage("0?SP_Par?unsignedByte", std::string(1, '\0'));
  stage("0?SP_Mode?unsignedByte", std::string(1, '\0'));
  stage("0?SP_RxPrefix?string-64", "02");
  stage("0?SP_RxSuffix?string-64", "03");
  stage("0?SP_TxPrefix?string-64", "02");
  stage("0?SP_TxSuffix?string-64", "03");
  stage("0?SP_Gap?unsignedInt", std::string("\x14\0\0\0", 4));
  stage("0?SP_HexTokens?boolean", std::string(1, '\0'));
  stage("0?SP_TokenQueueSize?unsignedInt", std::string("\x64\0\0\0", 4));
  const ITag* const done = bench.Tag("0?SP_Done?boolean");
  const unsigned char one = 1;
  if (!bench.Check(state, isStaged && bench.Driver().Write(done, &one) != 0)) {
    return;
  }
  const Counted counted(state, 1);
  for (auto _ : state) {
    benchmark::DoNotOptimize(bench.Driver().Write(done, &one));
  }
}

void RunCommand(benchmark::State& state, const std::string& command) {
  Bench bench;
  bench.Driver().Task();
  std::array<char, 4096> reply{};
  const Counted counted(state, 1);
  for (auto _ : state) {
    benchmark::DoNotOptimize(
        bench.Driver().DoCommand(command.c_str(), reply.data(), static_cast<int>(reply.size())));
  }
}

void RegisterCommands() {
  benchmark::RegisterBenchmark("write/SP_Done, everything staged", EverythingStaged);
  for (const char* const command :
       {"help", "connect ON", "get_stat", "put ABC", "get", "get_token_length", "tokens_available",
        "token_ack", "set_hexToken OFF", "set_rxGap 20", "set_rxPrefix 02", "set_rxSuffix 03",
        "set_txPrefix 02", "set_txSuffix 03"}) {
    benchmark::RegisterBenchmark((std::string("console/") + command).c_str(), RunCommand, command);
  }
}

// --- growth ---

// One token in and out again while the queue is full.
void GrowQueue(benchmark::State& state) {
  Bench bench("rx_prefix=02 rx_suffix=03 token_queue_size=" + std::to_string(state.range(0)));
  for (int i = 0; i < 3 * state.range(0); ++i) {
    bench.Driver().Task();
  }
  const ITag* const token = bench.Tag("0?rx_token?string-128");
  std::array<unsigned char, 128> value{};
  const Counted counted(state, 1);
  for (auto _ : state) {
    bench.Driver().Task();
    bench.Driver().Read(token, value.data());
  }
}

void GrowTagsCreate(benchmark::State& state) {
  Bench bench;
  const auto count = static_cast<std::size_t>(state.range(0));
  std::vector<ITag*> tags(count);
  const Counted counted(state, static_cast<double>(count));
  for (auto _ : state) {
    for (ITag*& tag : tags) {
      tag = bench.Tag("0?rx_token?string-128");
    }
    state.PauseTiming();
    for (ITag* tag : tags) {
      bench.Driver().FreeTag(tag);
    }
    state.ResumeTiming();
  }
}

void GrowTagsRead(benchmark::State& state) {
  Bench bench;
  ITag* tag = nullptr;
  for (int i = 0; i < state.range(0); ++i) {
    tag = bench.Tag("0?tokens_available?unsignedInt");
  }
  std::array<unsigned char, 4> value{};
  const Counted counted(state, 1);
  for (auto _ : state) {
    benchmark::DoNotOptimize(bench.Driver().Read(tag, value.data()));
  }
}

// One tag is freed among many, and made again at the end of the list.
void GrowTagsFreeOne(benchmark::State& state) {
  Bench bench;
  const auto count = static_cast<std::size_t>(state.range(0));
  std::vector<ITag*> tags;
  for (std::size_t i = 0; i < count; ++i) {
    tags.push_back(bench.Tag("0?rx_token?string-128"));
  }
  std::size_t next = count / 2;
  const Counted counted(state, 1);
  for (auto _ : state) {
    bench.Driver().FreeTag(tags[next]);
    tags[next] = bench.Tag("0?rx_token?string-128");
    next = (next + 7919) % count;
  }
}

void GrowPrefix(benchmark::State& state) {
  const auto length = static_cast<std::size_t>(state.range(0));
  Bench bench("rx_prefix=" + HexOf(length, "50") + " rx_suffix=03 token_queue_size=100");
  MeasurePasses(state, bench, std::string(length, 'P') + std::string(200, 'x') + "\x03", false);
}

void GrowSuffix(benchmark::State& state) {
  const auto length = static_cast<std::size_t>(state.range(0));
  Bench bench("rx_prefix=02 rx_suffix=" + HexOf(length, "53") + " token_queue_size=100");
  MeasurePasses(state, bench, "\x02" + std::string(200, 'x') + std::string(length, 'S'), false);
}

void GrowConfiguration(benchmark::State& state) {
  Bench bench;
  std::string text = std::string(kMandatory) + kFramed;
  while (text.size() < static_cast<std::size_t>(state.range(0))) {
    text += "remark=nothing-to-see-here ";
  }
  const Counted counted(state, static_cast<double>(text.size()));
  for (auto _ : state) {
    benchmark::DoNotOptimize(bench.Driver().Config(text.c_str()));
  }
}

void GrowToken(benchmark::State& state) {
  Bench bench;
  MeasurePasses(state, bench, Frame(static_cast<std::size_t>(state.range(0)) - 2), false);
}

void RegisterGrowth() {
  const auto each = [](const char* name, void (*measure)(benchmark::State&),
                       std::initializer_list<long> sizes) {
    auto* const registered = benchmark::RegisterBenchmark(name, measure);
    for (const long size : sizes) {
      registered->Arg(size);
    }
  };
  each("queue size", GrowQueue, {1, 10, 100, 1000, 10000});
  each("tags, creation", GrowTagsCreate, {1, 10, 100, 1000, 10000, 100000});
  each("tags, reading one", GrowTagsRead, {1, 10, 100, 1000, 10000, 100000});
  each("tags, freeing one", GrowTagsFreeOne, {1, 10, 100, 1000, 10000, 100000});
  each("prefix length", GrowPrefix, {1, 4, 16, 64});
  each("suffix length", GrowSuffix, {1, 4, 16, 64});
  each("configuration text", GrowConfiguration, {200, 1000, 10000, 100000, 1000000});
  each("frame length", GrowToken, {3, 10, 100, 300, 1000});
}

// So many tokens by the driver or the lean loop and nothing else, for a profiler that counts.
int Profile(const std::string& which, std::size_t payload, int tokens) {
  if (which == "lean") {
    EndlessPort line;
    line.Play(Frame(payload), false);
    const auto semaphore = MakeMutexSemaphore();
    ObligedLoop loop(&line, semaphore.get(), ObligedLoop::Compare::kLastByteFirst);
    std::string_view token;
    for (int i = 0; i < tokens; ++i) {
      benchmark::DoNotOptimize(loop.Next(&token));
    }
    return 0;
  }
  Bench bench;
  bench.Line().Play(Frame(payload), false);
  for (int i = 0; i < tokens; ++i) {
    bench.Driver().Task();
  }
  return 0;
}

}  // namespace

// "profile driver|lean PAYLOAD TOKENS" runs that alone.
int main(int argumentCount, char** arguments) {
  if (argumentCount == 5 && std::string(arguments[1]) == "profile") {
    return Profile(arguments[2], std::stoul(arguments[3]), std::stoi(arguments[4]));
  }
  RegisterBytes();
  RegisterTags();
  RegisterCommands();
  RegisterGrowth();
  benchmark::Initialize(&argumentCount, arguments);
  if (benchmark::ReportUnrecognizedArguments(argumentCount, arguments)) {
    return 2;
  }
  benchmark::RunSpecifiedBenchmarks();
  return 0;
}
