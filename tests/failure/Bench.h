// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <string>

#include "interfaces/IProtocol7.h"
#include "interfaces/ITag.h"
#include "tests/support/PluginUnderTest.h"
#include "tests/support/ScriptedHost.h"

// One driver in one scripted host, with what a step under faults needs at hand: buffers that exist
// before the fault, so that nothing but the driver allocates while one is armed.
class Bench {
 public:
  static constexpr int kValueBytes = 600;

  // Binds the module.
  Bench();
  Bench(const Bench&) = delete;
  Bench& operator=(const Bench&) = delete;
  // Stops, deletes and closes what is left.
  ~Bench();

  // Ends everything and gives what was not given back, or which rules were broken; empty when all
  // is well.
  std::string End();

  ScriptedHost host;
  PluginUnderTest plugin;
  IProtocol7* protocol = nullptr;
  ITag* tag = nullptr;
  std::array<unsigned char, kValueBytes> value{};
  std::array<char, 4000> reply{};

  // --- preparations, each of which must succeed ---

  void Create();
  // Creates, configures with Texts::kConfig and more, and starts; two tokens wait.
  void Run(const char* more = "");
  void Start();
  void MakeTag(const char* uri);
  void SetValue(const std::string& bytes);
  void SetNumber(unsigned int number);
  void Write(const char* uri, const std::string& bytes);
  void Feed(const std::string& line) { host.Line().Feed(line); }

  // --- what a step may look at ---

  // The tokens that wait, oldest first, joined by "|", each as text up to its first zero. They
  // stay.
  std::string Front();
  int TokenCount();
  bool IsReply(const std::string& text) const;

  // The protocol does everyday work: a new cycle, a token received, read and acknowledged, one
  // sent. What it cannot do any more, or empty.
  std::string WhatFails();

 private:
  std::string SendsAndReceives();

  bool isEnded_ = false;
};

// Texts that are too long for a short string, so that copies of them allocate.
namespace Texts {

extern const std::string kIdent;
extern const std::string kHexText;
extern const std::string kConfig;

}  // namespace Texts
