// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "protlib/CfgParser.h"

// The namespace's name is given by the plug-in's exported layout, although the language reserves
// such names; it is the only one.
namespace _LOKA {

// The parameters of one node.
struct NodeParams {
  int nodeId = CfgParser::kNoNode;
  std::string model;
};

// The parameters of the whole protocol. Fields without a default have to be configured.
struct CommonParams {
  static constexpr int kDefaultGapMs = 0;
  static constexpr bool kDefaultHexTokens = false;
  static constexpr int kDefaultTokenQueueSize = 100;
  static constexpr int kSmallestTokenQueueSize = 1;
  static constexpr int kLargestTokenQueueSize = 10000;
  static constexpr bool kDefaultAutoConnect = true;

  std::string port;
  int baudrate = 0;  // bits a second
  std::string parity;
  int bits = 0;
  int stopbits = 0;
  std::string mode;
  std::string rx_prefix;  // the four framing texts are hex text
  std::string rx_suffix;
  int gap = 0;  // ms
  std::string tx_prefix;
  std::string tx_suffix;
  bool hex_tokens = false;
  int token_queue_size = 0;
  bool autoConnect = false;

  // Reads every key, stops at the first bad one. False with the message in `error`; the fields read
  // before keep their new values.
  bool parse(CfgParser& parser, std::string& error);

 private:
  bool ParseRequired(CfgParser& parser, std::string& error);
  bool ParseOptional(CfgParser& parser, std::string& error);
  bool Validate(std::string& error) const;
};

// Turns the configuration text into typed parameters. Parsed before Start on the host's thread; the
// records are then only read, from any thread.
class ParamManager {
 public:
  // False at the first error, with its message in getLastError. A second parse appends its node
  // records behind the first ones and replaces everything else. May throw std::bad_alloc.
  bool parse(const char* cfg);

  // Never null.
  const CommonParams* getCommonParams() const { return &common_; }

  // The first record of that node, or the default record (node -1). Never null.
  const NodeParams* getNodeParams(int nodeId) const;

  // Message of the last failed parse.
  const char* getLastError() const { return lastError_.c_str(); }

 private:
  bool ParseNodes(CfgParser& parser);

  std::vector<NodeParams> nodes_;
  NodeParams defaultNode_;
  CommonParams common_;
  std::string lastError_;
};

}  // namespace _LOKA
