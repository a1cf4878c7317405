// SPDX-License-Identifier: Apache-2.0
#include "driver/ParamManager.h"

#include <algorithm>

#include "driver/ConfigKeys.h"
#include "driver/HexText.h"
#include "driver/Texts_LOKA.h"
#include "protlib/CfgParserN.h"

namespace _LOKA {

namespace {

constexpr bool kOptional = true;
constexpr bool kRequired = false;

// Reads one parameter into `out`, which keeps the caller's default when an optional one is absent.
// False with the message in `error`.
template <typename T>
bool readParam(CfgParser& parser, const char* name, int node, T& out, int flags, bool optional,
               std::string& error) {
  std::string text;
  CfgParser::parseResult result = parser.getParam(name, node, text, flags);
  if (result == CfgParser::prOk && !CfgParserN::parseValue(text, out)) {
    result = CfgParser::prIllegalValue;
  }
  if (result == CfgParser::prOk || result == CfgParser::prNodeDependent ||
      (result == CfgParser::prNotFound && optional)) {
    return true;
  }
  error = CfgParserN::getErrorString(result, name);
  return false;
}

// Reads a protocol-wide parameter.
template <typename T>
bool ReadCommon(CfgParser& parser, const char* name, T& out, bool optional, std::string& error) {
  return readParam(parser, name, CfgParser::kNoNode, out, CfgParser::cfgCommonOnly, optional,
                   error);
}

template <typename T>
bool ReadOptional(CfgParser& parser, const char* name, T& out, const T& defaultValue,
                  std::string& error) {
  out = defaultValue;
  return ReadCommon(parser, name, out, kOptional, error);
}

}  // namespace

bool CommonParams::parse(CfgParser& parser, std::string& error) {
  return ParseRequired(parser, error) && ParseOptional(parser, error) && Validate(error);
}

bool CommonParams::ParseRequired(CfgParser& parser, std::string& error) {
  return ReadCommon(parser, ConfigKeys::kPort, port, kRequired, error) &&
         ReadCommon(parser, ConfigKeys::kBaudrate, baudrate, kRequired, error) &&
         ReadCommon(parser, ConfigKeys::kParity, parity, kRequired, error) &&
         ReadCommon(parser, ConfigKeys::kBits, bits, kRequired, error) &&
         ReadCommon(parser, ConfigKeys::kStopbits, stopbits, kRequired, error) &&
         ReadCommon(parser, ConfigKeys::kMode, mode, kRequired, error);
}

bool CommonParams::ParseOptional(CfgParser& parser, std::string& error) {
  const std::string kEmpty;
  return ReadOptional(parser, ConfigKeys::kRxPrefix, rx_prefix, kEmpty, error) &&
         ReadOptional(parser, ConfigKeys::kRxSuffix, rx_suffix, kEmpty, error) &&
         ReadOptional(parser, ConfigKeys::kGap, gap, kDefaultGapMs, error) &&
         ReadOptional(parser, ConfigKeys::kTxPrefix, tx_prefix, kEmpty, error) &&
         ReadOptional(parser, ConfigKeys::kTxSuffix, tx_suffix, kEmpty, error) &&
         ReadOptional(parser, ConfigKeys::kHexTokens, hex_tokens, kDefaultHexTokens, error) &&
         ReadOptional(parser, ConfigKeys::kTokenQueueSize, token_queue_size, kDefaultTokenQueueSize,
                      error) &&
         ReadOptional(parser, ConfigKeys::kAutoConnect, autoConnect, kDefaultAutoConnect, error);
}

bool CommonParams::Validate(std::string& error) const {
  if (token_queue_size < kSmallestTokenQueueSize || token_queue_size > kLargestTokenQueueSize) {
    error = Texts_LOKA::kBadQueueSize;
    return false;
  }
  const auto requireHex = [&error](const std::string& text, const char* message) {
    if (isHex(text.c_str())) {
      return true;
    }
    error = message;
    return false;
  };
  return requireHex(rx_prefix, Texts_LOKA::kConfigRxPrefixNotHex) &&
         requireHex(rx_suffix, Texts_LOKA::kConfigRxSuffixNotHex) &&
         requireHex(tx_prefix, Texts_LOKA::kConfigTxPrefixNotHex) &&
         requireHex(tx_suffix, Texts_LOKA::kConfigTxSuffixNotHex);
}

bool ParamManager::parse(const char* cfg) {
  CfgParser parser(cfg);
  if (!parser.KnownFormat()) {
    lastError_ = Texts_LOKA::kUnknownFormat;
    return false;
  }
  defaultNode_.nodeId = CfgParser::kNoNode;
  return readParam(parser, ConfigKeys::kModel, CfgParser::kNoNode, defaultNode_.model, 0, kRequired,
                   lastError_) &&
         ParseNodes(parser) && common_.parse(parser, lastError_);
}

bool ParamManager::ParseNodes(CfgParser& parser) {
  for (int i = 0; i < parser.GetNodeCount(); ++i) {
    NodeParams node;
    node.nodeId = parser.GetNodeID(i);
    node.model = defaultNode_.model;
    if (!readParam(parser, ConfigKeys::kModel, node.nodeId, node.model, 0, kRequired, lastError_)) {
      return false;
    }
    nodes_.push_back(node);
  }
  return true;
}

const NodeParams* ParamManager::getNodeParams(int nodeId) const {
  const auto found = std::find_if(nodes_.begin(), nodes_.end(), [nodeId](const NodeParams& node) {
    return node.nodeId == nodeId;
  });
  return found == nodes_.end() ? &defaultNode_ : &*found;
}

}  // namespace _LOKA
