// SPDX-License-Identifier: Apache-2.0
// Any type specification with any list of conversions: lengths fit together, no conversion leaves
// its buffers, and what is written reads back. The same through the driver, where a setting that is
// written through conversions reads back through them.
//
// Input: a line with a specification (a first byte below 128 picks a type and conversions instead
// of text), and the bytes of a value. Replay: build/fuzz/fuzz_conversion FILE
#include <algorithm>
#include <memory>
#include <vector>

#include "fuzz/FuzzInput.h"
#include "fuzz/FuzzedDriver.h"
#include "fuzz/Require.h"
#include "protlib/ProtUtilsN.h"
#include "tests/support/GuardedBuffer.h"
#include "tests/unit/FakeTag.h"

namespace {

constexpr int kLongestBytes = 2000;
constexpr const char* kConversions[] = {"swapnibble", "swap2", "swap4", "swap8", "bcd",
                                        "neg",        "inv",   "Bcd",   ""};

// A specification from bytes: mostly ones that mean something.
std::string BuiltSpecification(FuzzInput& input, unsigned int first) {
  const ProtUtilsN::DataType& type = ProtUtilsN::DataTypes[first % ProtUtilsN::DataTypes.size()];
  std::string spec = type.name;
  if (spec.back() == '-') spec += std::to_string(input.Byte());
  std::string list;
  for (std::size_t left = input.Below(5); left > 0; --left) {
    list += (list.empty() ? "" : ",") + std::string(kConversions[input.Below(9)]);
  }
  return list.empty() ? spec : spec + "(" + list + ")";
}

std::string Specification(FuzzInput& input) {
  const unsigned int first = input.Byte();
  return first < 128 ? BuiltSpecification(input, first) : input.Line();
}

bool Has(const std::vector<std::string>& list, const std::string& word) {
  return std::find(list.begin(), list.end(), word) != list.end();
}

// Writes the value toward the device and reads it back.
void CheckRoundTrip(FakeTag& tag, const std::string& value) {
  const auto length = static_cast<std::size_t>(tag.GetVarLength());
  const auto packed = static_cast<std::size_t>(tag.PackedLen());
  const std::unique_ptr<unsigned char[]> source(new unsigned char[length]());
  std::copy_n(value.begin(), std::min(length, value.size()), source.get());
  const bool isBits = ProtUtilsN::IsBitType(&tag);
  for (std::size_t i = 0; isBits && i < length; ++i) source[i] = source[i] % 2;

  GuardedBuffer device(packed);
  const bool isWritten = tag.Convert(source.get(), device.Data(), true);
  Require(device.AreGuardsIntact(), "a conversion writes beside the device image");
  Require(isWritten || device.IsUntouched(), "a failed conversion writes");
  Require(isWritten || !tag.GetErrorText().empty(), "a failed conversion without a text");
  if (!isWritten) return;

  // A bit whose host byte was moved to the upper half is one bit again in the device.
  if (isBits && Has(tag.Conversions(), "swapnibble")) return;

  GuardedBuffer back(length);
  Require(tag.Convert(device.Data(), back.Data(), false), "what was written cannot be read");
  Require(back.AreGuardsIntact(), "a conversion writes beside the value");
  Require(back.Bytes() == std::string(source.get(), source.get() + length),
          "another value than was written");
}

// The name of a type leads back to the type. An object has no length to be named by.
void CheckName(ICU_Type type, int length) {
  if (type == ICU_OBJECT) return;
  const std::string name = ProtUtilsN::GetVADOName(type, length);
  ICU_Type again = ICU_NONE;
  ICU_Type itemType = ICU_NONE;
  int lengthAgain = -1;
  std::vector<std::string> list;
  Require(ProtUtilsN::GetVADOType(name, again, itemType, lengthAgain, list) && again == type,
          "the name " + name + " is another type");
  const int surplus = itemType == ICU_NONE ? 0 : length % ProtUtilsN::GetDataLength(itemType);
  Require(lengthAgain == length - surplus, "the name " + name + " is another length");
}

void CheckType(const std::string& spec, const std::string& value) {
  ICU_Type type = ICU_NONE;
  ICU_Type itemType = ICU_NONE;
  int length = -1;
  std::vector<std::string> list;
  const bool isKnown = ProtUtilsN::GetVADOType(spec, type, itemType, length, list);
  Require(isKnown || (type == ICU_NONE && length == -1), "an unknown type writes");
  if (!isKnown) return;
  Require(length >= 0, "a negative length");
  CheckName(type, length);
  if (length > kLongestBytes) return;
  FakeTag tag(spec);
  for (const int bit : {0, 1, 7}) {
    tag.bitIndex = bit;
    CheckRoundTrip(tag, value);
  }
}

// The driver accepts every number for these, so every value that a conversion takes reads back.
void CheckThroughDriver(const std::vector<std::string>& list, const std::string& value) {
  std::string conversions;
  for (const std::string& word : list) {
    conversions += (conversions.empty() ? "(" : ",") + word;
  }
  if (!conversions.empty()) conversions += ")";
  FuzzedDriver driver;
  driver.Run("");
  for (const char* memoryType : {"SP_Gap", "SP_TokenQueueSize"}) {
    ITag* const tag =
        driver->CreateTag(("0?" + std::string(memoryType) + "?unsignedInt" + conversions).c_str());
    if (tag == nullptr) return;  // a conversion with a bracket or a question mark in it
    if (driver.Write(tag, value) == 0) {
      Require(driver->GetLastError() == -9, "a setting is refused for another reason");
      continue;
    }
    std::string padded = value;
    padded.resize(4, '\0');
    const FuzzedRead outcome = driver.Read(tag);
    Require(outcome.result != 0, "a setting that was written cannot be read");
    Require(outcome.bytes == padded, "a setting reads back another value");
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
  FuzzInput input(data, size);
  const std::string spec = Specification(input);
  const std::string value = input.Rest();
  CheckType(spec, value);
  ICU_Type type = ICU_NONE;
  int length = 0;
  std::vector<std::string> list;
  if (ProtUtilsN::GetVADOType(spec, type, type, length, list)) CheckThroughDriver(list, value);
  return 0;
}
