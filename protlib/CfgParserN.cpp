// SPDX-License-Identifier: Apache-2.0
#include "protlib/CfgParserN.h"

#include <string_view>

#include "protlib/ParseInt.h"

namespace CfgParserN {

namespace {

const char* MessageTail(CfgParser::parseResult r) {
  switch (r) {
    case CfgParser::prNotFound:
      return "is not found";
    case CfgParser::prIllegalValue:
      return "has illegal value";
    case CfgParser::prCantBePrefixed:
      return "can't be prefixed";
    case CfgParser::prCantBeNodeIndependent:
      return "can't be node independent";
    case CfgParser::prInvalidSpecification:
      return "has invalid internal specification";
    case CfgParser::prOk:
    case CfgParser::prNodeDependent:
      break;
  }
  return "has unknown error";
}

}  // namespace

bool parseValue(const std::string& in, std::string& out) {
  constexpr std::string_view kSpaceEntity = "&nbsp;";
  std::string text;
  std::size_t begin = 0;
  for (std::size_t at = in.find(kSpaceEntity); at != std::string::npos;
       at = in.find(kSpaceEntity, begin)) {
    text.append(in, begin, at - begin).append(1, ' ');
    begin = at + kSpaceEntity.size();
  }
  out = text.append(in.substr(begin));
  return true;
}

bool parseValue(const std::string& in, bool& out) {
  if (in != "true" && in != "false") {
    return false;
  }
  out = in == "true";
  return true;
}

bool parseValue(const std::string& in, int& out) {
  out = ParseInt(in.c_str(), 0);
  return true;
}

std::string getErrorString(CfgParser::parseResult r, const char* name) {
  return std::string("Parser: parameter '") + name + "' " + MessageTail(r);
}

}  // namespace CfgParserN
