// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

// Reads the section of a configuration text that belongs to this driver. The text may carry several
// sections, each opened by "CfgVer=" and a version; the first one opened by "CfgVer=1" counts.
// Within it a parameter is a name, "=" and a value that ends at white space; "Node", a number and
// "::" in front of the name make it the parameter of one node.
//
// A parser serves one thread, for one parse. No operation fails on bad text.
class CfgParser {
 public:
  // Result of a look-up, in the order of severity.
  enum parseResult : int {
    prOk = 0,
    prNodeDependent = 1,          // to be given per node, and no common value is given: no error
    prNotFound = 2,               // the parameter is not there
    prIllegalValue = 3,           // the text cannot be converted
    prCantBePrefixed = 4,         // given for a node although it is a common parameter
    prCantBeNodeIndependent = 5,  // given in common although it is a node parameter
    prInvalidSpecification = 6,   // the caller's flags contradict each other
  };

  // Look-up flags.
  static constexpr int cfgCommonOnly = 1;  // must not be given for a node
  static constexpr int cfgNodeOnly = 2;    // must be given per node when there are nodes

  // "No node" for getParam.
  static constexpr int kNoNode = -1;

  explicit CfgParser(const char* cfg);

  // Whether the text holds a section of version 1.
  bool KnownFormat() const { return knownFormat_; }

  // The node numbers of the section in order of first appearance. An index outside gives 0.
  int GetNodeCount() const { return static_cast<int>(nodeIds_.size()); }
  int GetNodeID(int index) const;

  // Raw look-up of a key. Null when it is absent; valid until the next look-up.
  const char* GetParam(const char* name);

  // Look-up by the node rules. `out` is written only with prOk.
  parseResult getParam(const char* name, int node, std::string& out, int flags);

 private:
  void SelectSection();
  void FindNodes();

  std::string text_;
  std::string lastValue_;
  std::vector<int> nodeIds_;
  bool knownFormat_ = false;
};
