// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <gtest/gtest.h>

#include <string>

#include "tests/plugin/ProtocolUnderTest.h"
#include "tests/support/PluginUnderTest.h"
#include "tests/support/ScriptedHost.h"

// The keys that a configuration must have, with 02 and 03 around each received token.
inline constexpr const char* kMandatory =
    "CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 mode=RS-232";

inline std::string Mandatory(const std::string& more = "") { return kMandatory + (" " + more); }

// A scripted host with the plug-in's module bound to it. At the end everything must have been given
// back and no rule of the host's objects broken.
class PluginFixture : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_TRUE(plugin_.IsLoaded()) << PluginLibrary::Shared().Error();
    ASSERT_EQ(plugin_.Init(&host_), 1) << plugin_.Module()->GetLastError();
    host_.Log().Take();
  }

  void TearDown() override {
    if (!plugin_.IsLoaded()) return;
    plugin_.Close();
    EXPECT_EQ(host_.Complaints(), "");
  }

  ScriptedHost host_;
  PluginUnderTest plugin_;
};

// The same with one protocol instance, not configured yet.
class ProtocolFixture : public PluginFixture {
 protected:
  void SetUp() override {
    PluginFixture::SetUp();
    if (HasFatalFailure()) return;
    protocol_ = std::make_unique<ProtocolUnderTest>(plugin_);
    ASSERT_NE(protocol_->Get(), nullptr);
    host_.Log().Take();
  }

  void TearDown() override {
    if (protocol_ != nullptr && protocol_->Get() != nullptr) {
      // Whatever a test left running ends here; a stop that was told to fail fails no more.
      host_.Faults().Clear();
      protocol_->Get()->Stop();
      protocol_->Delete();
    }
    PluginFixture::TearDown();
  }

  // Configures and starts with the mandatory keys and more; leaves an empty record.
  void Run(const std::string& more = "") {
    ASSERT_TRUE(protocol_->Config(Mandatory(more))) << protocol_->Error();
    ASSERT_NE(protocol_->Get()->Start(), 0) << protocol_->Error();
    host_.Log().Take();
  }

  // Lets the line do something and runs the receive task until it is silent.
  void Receive(const std::string& bytes) {
    host_.Line().Feed(bytes);
    host_.RunUntilSilent();
  }

  ProtocolUnderTest& P() { return *protocol_; }
  std::string Calls() { return host_.Log().Take(); }

  std::unique_ptr<ProtocolUnderTest> protocol_;
};
