// SPDX-License-Identifier: Apache-2.0
#include "host/demo/DemoSteps.h"

#include <cstdio>
#include <utility>

#include "host/base/ChildProcess.h"
#include "host/base/Deadline.h"
#include "host/demo/DemoLimit.h"
#include "host/text/ByteText.h"

namespace {

constexpr const char* kFramed = "rx_prefix=02 rx_suffix=03";

std::string Quoted(const std::string& text) { return "\"" + EscapeBytes(text) + "\""; }

}  // namespace

DemoSteps::DemoSteps(std::string pluginFile, std::string storeFile, DemoDevice* device,
                     DemoReport* report)
    : pluginFile_(std::move(pluginFile)),
      storeFile_(std::move(storeFile)),
      device_(device),
      report_(report) {}

void DemoSteps::RunAll() {
  Run("receive framing: prefix and suffix", &DemoSteps::PrefixAndSuffix);
  Run("receive framing: prefix only", &DemoSteps::PrefixOnly);
  Run("receive framing: suffix only", &DemoSteps::SuffixOnly);
  Run("receive framing: silence only", &DemoSteps::GapOnly);
  Run("hex tokens", &DemoSteps::HexTokens);
  Run("full queue: the oldest token goes", &DemoSteps::QueueOverflow);
  Run("sending a token", &DemoSteps::SentToken);
  Run("silence drops a token without its suffix", &DemoSteps::PartialToken);
  Run("run-time override: staged", &DemoSteps::StagedOverride);
  Run("run-time override: applied and stored", &DemoSteps::AppliedOverride);
  Run("run-time override: after a restart", &DemoSteps::OverrideAfterRestart);
  host_.reset();
}

void DemoSteps::Run(const std::string& title, void (DemoSteps::*step)()) {
  report_->Begin(title);
  try {
    (this->*step)();
  } catch (const DemoError& error) {
    if (error.Status() != ExitStatus::kRefused) {
      throw;
    }
    report_->Fail(error.what());
  }
  report_->End();
}

void DemoSteps::StartHost(const std::string& configuration, bool withStore) {
  host_.reset();
  report_->Show("configuration", configuration);
  host_ = std::make_unique<DemoHost>(DemoHostOptions{
      pluginFile_, device_->PortPath(), withStore ? storeFile_ : std::string(), configuration});
}

void DemoSteps::DeviceSends(const std::string& bytes) {
  report_->Show("device sends", HexBytes(bytes) + "   " + Quoted(bytes));
  if (!device_->Send(bytes)) {
    report_->Fail("the simulated device does not send");
  }
}

void DemoSteps::ExpectWaiting(unsigned int count) {
  report_->Expect("tokens_available",
                  std::to_string(host_->Number("tokens_available", "unsignedInt")),
                  std::to_string(count));
}

void DemoSteps::ExpectToken(const std::string& token) {
  if (!host_->WaitForTokens(1)) {
    report_->Fail("no token within " + std::to_string(kDemoLimitMs) + " ms");
    return;
  }
  report_->Expect("rx_token_len", std::to_string(host_->Number("rx_token_len", "unsignedInt")),
                  std::to_string(token.size()));
  report_->Expect("rx_token", Quoted(host_->Text("rx_token")), Quoted(token));
}

void DemoSteps::Acknowledge() {
  host_->WriteNumber("token_ack", "boolean", 1);
  report_->Show("token_ack <- 1", "the oldest token is dropped");
}

void DemoSteps::PrefixAndSuffix() {
  StartHost(kFramed, false);
  DeviceSends(
      "\x02"
      "AB\x03");
  (void)host_->WaitForTokens(1);
  ExpectWaiting(1);
  ExpectToken("AB");
  Acknowledge();
  ExpectWaiting(0);
}

void DemoSteps::PrefixOnly() {
  StartHost("rx_prefix=02", false);
  DeviceSends(
      "\x02"
      "AB\x02"
      "CD");
  // The second token ends with the silence that follows.
  (void)host_->WaitForTokens(2);
  ExpectWaiting(2);
  ExpectToken("AB");
  Acknowledge();
  ExpectToken("CD");
}

void DemoSteps::SuffixOnly() {
  StartHost("rx_suffix=0D0A", false);
  DeviceSends("12.5 kg\r\n");
  ExpectToken("12.5 kg");
}

void DemoSteps::GapOnly() {
  StartHost("gap=" + std::to_string(DemoHost::kGapMs), false);
  DeviceSends("HELLO");
  ExpectToken("HELLO");
  Acknowledge();
  DeviceSends("WORLD");
  ExpectToken("WORLD");
}

void DemoSteps::HexTokens() {
  StartHost(std::string(kFramed) + " hex_tokens=true", false);
  DeviceSends(std::string("\x02\x00\x1B\xFF\x03", 5));
  ExpectToken("001BFF");
}

void DemoSteps::QueueOverflow() {
  StartHost(std::string(kFramed) + " token_queue_size=3", false);
  const std::string bytes =
      "\x02"
      "A\x03\x02"
      "B\x03\x02"
      "C\x03\x02"
      "D\x03";
  DeviceSends(bytes);
  (void)host_->WaitForBytes(bytes.size());
  ExpectWaiting(3);
  for (const char* const token : {"B", "C", "D"}) {
    ExpectToken(token);
    Acknowledge();
  }
  ExpectWaiting(0);
}

void DemoSteps::SentToken() {
  StartHost("tx_prefix=02 tx_suffix=0D0A", false);
  host_->WriteText("tx_token", "CD");
  report_->Show("tx_token <-", Quoted("CD"));
  const std::string expected =
      "\x02"
      "CD\r\n";
  const std::string seen = device_->TakeSeen(expected.size(), Deadline::After(kDemoLimitMs));
  for (std::size_t i = 0; i < seen.size() || i < expected.size(); ++i) {
    const std::string label = "device sees byte " + std::to_string(i + 1);
    report_->Expect(label, i < seen.size() ? HexBytes(seen.substr(i, 1)) : "nothing",
                    i < expected.size() ? HexBytes(expected.substr(i, 1)) : "nothing");
  }
}

void DemoSteps::PartialToken() {
  StartHost(kFramed, false);
  DeviceSends(
      "\x02"
      "A");
  const bool isDropped = host_->WaitForBytes(2) && host_->WaitForNewPass();
  report_->Expect("line", isDropped ? "silent, the beginning is dropped" : "no silence seen",
                  "silent, the beginning is dropped");
  DeviceSends(
      "B\x03\x02"
      "C\x03");
  ExpectToken("C");
  ExpectWaiting(1);
}

void DemoSteps::StagedOverride() {
  StartHost(kFramed, true);
  host_->WriteText("SP_RxSuffix", "3B");
  report_->Show("SP_RxSuffix <-", Quoted("3B"));
  report_->Expect("SP_RxSuffix (staged)", Quoted(host_->Text("SP_RxSuffix")), Quoted("3B"));
  report_->Show("", "the line still ends tokens with 03");
  DeviceSends(
      "\x02"
      "A;B\x03");
  ExpectToken("A;B");
}

void DemoSteps::AppliedOverride() {
  ExpectWaiting(1);
  host_->WriteNumber("SP_Done", "boolean", 1);
  report_->Show("SP_Done <- 1", "applied and stored; the queue is emptied");
  ExpectWaiting(0);
  (void)host_->WaitForNewPass();
  DeviceSends(
      "\x02"
      "C\x03;");
  ExpectToken("C\x03");
}

void DemoSteps::OverrideAfterRestart() {
  host_.reset();
  ChildProcess restarted("/proc/self/exe", {"loka", "demo-restarted", "--port", device_->PortPath(),
                                            "--store", storeFile_, "--plugin", pluginFile_});
  report_->Show("host", "runs again as process " + std::to_string(restarted.ProcessId()));
  report_->Show("configuration", kFramed);
  const Deadline deadline = Deadline::After(kDemoLimitMs);
  std::string line;
  (void)restarted.ReadLine(deadline, &line);
  report_->Expect("SP_RxSuffix", line, "suffix 3B");
  (void)restarted.ReadLine(deadline, &line);
  DeviceSends(
      "\x02"
      "D\x03;");
  (void)restarted.ReadLine(deadline, &line);
  report_->Expect("rx_token (hex)", line, "token 44 03");
  report_->Expect("host ends with status", std::to_string(restarted.Wait(deadline)), "0");
}

int RunDemoRestarted(const std::string& pluginFile, const std::string& portPath,
                     const std::string& storeFile) {
  (void)std::setvbuf(stdout, nullptr, _IOLBF, BUFSIZ);
  try {
    DemoHost host(DemoHostOptions{pluginFile, portPath, storeFile, kFramed});
    (void)std::printf("suffix %s\nready\n", host.Text("SP_RxSuffix").c_str());
    if (!host.WaitForTokens(1)) {
      return static_cast<int>(ExitStatus::kRefused);
    }
    (void)std::printf("token %s\n", HexBytes(host.Text("rx_token")).c_str());
    return static_cast<int>(ExitStatus::kDone);
  } catch (const DemoError& error) {
    (void)std::fprintf(stderr, "loka: %s\n", error.what());
    return static_cast<int>(error.Status());
  }
}
