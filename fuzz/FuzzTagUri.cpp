// SPDX-License-Identifier: Apache-2.0
// Any tag URI: it is refused with a reason, or the tag has lengths that fit together and every read
// and write of every length stays inside the caller's buffer.
//
// Input: a flag byte (hex mode), a line with a token that waits, a line with the URI, a line with a
// value to write, and block lengths of four bytes each.
// Replay: build/fuzz/fuzz_tag_uri FILE
#include "fuzz/FuzzInput.h"
#include "fuzz/FuzzedDriver.h"
#include "fuzz/Require.h"

namespace {

// Reads in blocks call the driver's inner read once an item, so long ones only cost time.
constexpr int kLongestBlockBytes = 4096;

void CheckTag(const ITag* tag, const std::string& uri) {
  Require(uri == tag->GetVarName(), "the tag has another name");
  Require(tag->GetVarLength() >= 0 && tag->PackedLen() >= 0, "a negative length");
  Require(tag->GetBitIndex() >= 0 && tag->GetBitIndex() < 8, "a bit outside its byte");
  Require(!(tag->IsReadOnly() && tag->IsWriteOnly()), "neither read nor written");
}

void CheckFields(FuzzedDriver& driver, const ITag* tag) {
  for (int index = -1; index <= 4; ++index) {
    int length = -1;
    const char* const field = driver->getTagUriField(tag, index, &length);
    Require((field != nullptr) == (index >= 0 && index < 3), "a valid URI has three fields");
    Require(field == nullptr || length >= 0, "a field without a length");
  }
}

void UseTag(FuzzedDriver& driver, const ITag* tag, const std::string& value, FuzzInput& input) {
  driver.Read(tag);
  driver.Write(tag, value);
  const FuzzedRead whole = driver.Read(tag);
  if (driver.Write(tag, whole.bytes) != 0) driver.Read(tag);
  while (!input.IsEmpty()) {
    const int length = input.Int();
    driver.ReadBlock(tag, length > 0 ? length % kLongestBlockBytes : length);
  }
  if (tag->GetVarLength() > FuzzedDriver::kLongestValueBytes) return;
  for (const int index : {-1, 0, 1, tag->GetVarLength() - 1, tag->GetVarLength()}) {
    unsigned char item[16] = {};
    driver->readArrayItem(tag, index, item);
    driver->writeArrayItem(tag, index, item);
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
  FuzzInput input(data, size);
  const bool hexTokens = input.Flag();
  const std::string token = input.Line();
  const std::string uri = std::string(input.Line().c_str());
  const std::string value = input.Line();

  FuzzedDriver driver;
  driver.Run(
      std::string("rx_prefix=02 rx_suffix=0D0A tx_prefix=02 token_queue_size=3 Node3::model=1 "
                  "Node4::model=7 hex_tokens=") +
      (hexTokens ? "true" : "false"));
  driver.Receive("\x02" + token + "\r\n");
  ITag* const tag = driver->CreateTag(uri.c_str());
  if (tag == nullptr) {
    Require(driver->GetLastError() == -1, "refused without an error code");
    const std::string reason = driver->GetLastErrorString();
    Require(reason.compare(0, 15, "Tag URI error: ") == 0, "refused without a reason: " + reason);
    return 0;
  }
  CheckTag(tag, uri);
  CheckFields(driver, tag);
  ITag* const copy = tag->Clone();
  CheckTag(copy, uri);
  UseTag(driver, tag, value, input);
  driver->FreeTag(tag);
  driver.Read(copy);
  driver->FreeTag(copy);
  return 0;
}
