// SPDX-License-Identifier: Apache-2.0
// Any of the 85 operations of a protocol in any order and any state, with arguments that a host
// could hold: living tags, copies of them, null, buffers that are as long as they are said to be,
// texts. Between them the line speaks, the receive task runs, and host calls fail.
//
// Input: a program; a byte picks what is done next and the bytes behind it are its arguments.
// Replay: build/fuzz/fuzz_operations FILE
#include <algorithm>
#include <array>
#include <memory>
#include <vector>

#include "fuzz/FuzzInput.h"
#include "fuzz/FuzzedDriver.h"
#include "fuzz/Require.h"
#include "protlib/ProtocolBase.h"
#include "protlib/TagBase.h"
#include "tests/support/GuardedBuffer.h"

namespace {

constexpr std::size_t kMostTags = 40;
constexpr int kLongestBlockBytes = 2048;

constexpr const char* kMemoryAndTypes[] = {
    "tx_token?string-6",        "rx_token?string-9",
    "rx_token_len?unsignedInt", "tokens_available?unsignedInt",
    "token_ack?boolean",        "connect?boolean",
    "SP_Baud?unsignedInt",      "SP_Bits?unsignedByte",
    "SP_Stop?unsignedByte",     "SP_Par?unsignedByte",
    "SP_Mode?unsignedByte",     "SP_RxPrefix?string-7",
    "SP_RxSuffix?string-7",     "SP_Gap?unsignedInt",
    "SP_TxPrefix?string-7",     "SP_TxSuffix?string-7",
    "SP_HexTokens?boolean",     "SP_TokenQueueSize?unsignedInt",
    "SP_Done?boolean",          "SP_Gap?unsignedInt(swap4,swapnibble)",
    "rx_token?string-300",      "SP_Bits?unsignedByte(bcd)",
    "rx_token?string-0",        "tx_token?string-2147483647"};

constexpr const char* kNames[] = {"Protocol_LOKA", "ProtocolBase", "IProtocol",  "IProtocol2",
                                  "IProtocol3",    "IProtocol4",   "IProtocol5", "IProtocol6",
                                  "IProtocol7",    "memorytype",   "node",       "datatype"};

constexpr const char* kFaults[] = {"OpenPort", "Setup",      "Send",         "StopTask",
                                   "Receive",  "CreateTask", "task.Start",   "CreateSemaphore",
                                   "Exists",   "GetString",  "GetStringInto"};

int BitsOf(int lengthBytes) { return lengthBytes > 0 ? lengthBytes * 8 : lengthBytes; }

class OperationsRun {
 public:
  explicit OperationsRun(FuzzInput& input) : input_(input) {}
  ~OperationsRun() { FreeAll(); }
  OperationsRun(const OperationsRun&) = delete;
  OperationsRun& operator=(const OperationsRun&) = delete;

  void Step() {
    const unsigned int choice = input_.Byte();
    if (choice < kSlots) {
      CallSlot(choice);
    } else {
      Surroundings(choice);
    }
    driver_.CheckRules();
  }

 private:
  static constexpr unsigned int kSlots = 85;

  // --- arguments ---

  const ITag* Tag() {
    const std::size_t index = input_.Below(kMostTags);
    return index < tags_.size() ? tags_[index] : nullptr;
  }

  std::string Text() { return input_.Text().c_str(); }
  const char* TextOrNull(const std::string& text) {
    return input_.Byte() % 8 == 0 ? nullptr : text.c_str();
  }

  // A length that a host may pass for a buffer of that length: mostly good ones, some not.
  int Length() {
    const int length = input_.Int();
    return length > 0 ? length % kLongestBlockBytes : length;
  }

  // A buffer as long as it is said to be, or null; nothing may be written beside it.
  template <typename Use>
  void WithBuffer(long long lengthBytes, Use use) {
    GuardedBuffer buffer(static_cast<std::size_t>(std::max(0LL, lengthBytes)));
    use(input_.Byte() % 16 == 0 ? nullptr : buffer.Data());
    Require(buffer.AreGuardsIntact(), "something was written beside a buffer");
  }

  // A buffer for a tag's value; tags that declare more than memory holds are left out.
  template <typename Use>
  void WithValue(const ITag* tag, Use use) {
    const int length = tag == nullptr ? 16 : std::max(tag->GetVarLength(), tag->PackedLen());
    if (length > FuzzedDriver::kLongestValueBytes) return;
    WithBuffer(length, use);
  }

  void WriteValue(const ITag* tag) {
    const int length = tag == nullptr ? 16 : tag->GetVarLength();
    if (length > FuzzedDriver::kLongestValueBytes) return;
    const auto size = static_cast<std::size_t>(length);
    const std::unique_ptr<unsigned char[]> value(new unsigned char[size]());
    const std::string bytes = input_.Text();
    std::copy_n(bytes.begin(), std::min(size, bytes.size()), value.get());
    driver_->Write(tag, value.get());
  }

  // --- tags ---

  void MakeTag() {
    if (tags_.size() >= kMostTags) return;
    const std::size_t row = input_.Below(std::size(kMemoryAndTypes) + 8);
    const std::string uri =
        row < std::size(kMemoryAndTypes) ? std::string("0?") + kMemoryAndTypes[row] : Text();
    Keep(driver_->CreateTag(TextOrNull(uri)));
  }

  void Keep(ITag* tag) {
    if (tag != nullptr) tags_.push_back(tag);
  }

  void FreeTag() {
    ITag* const tag = const_cast<ITag*>(Tag());
    driver_->FreeTag(tag);
    tags_.erase(std::remove(tags_.begin(), tags_.end(), tag), tags_.end());
  }

  void UseTag() {
    const ITag* const tag = Tag();
    if (tag == nullptr) return;
    if (input_.Flag()) Keep(tags_.size() < kMostTags ? tag->Clone() : nullptr);
    WithValue(tag, [&](unsigned char* to) {
      if (to == nullptr) return;
      WithValue(tag, [&](unsigned char* from) {
        tag->Convert(from, to, input_.Flag());
        tag->ConvertVariable(to, from, input_.Flag());
        tag->DoConversion(from, kNames[0], true);
        tag->DoConversion(from, "swap2", input_.Flag());
      });
    });
  }

  void Command() {
    const std::string command = Text();
    // The host has to forget what the console destroys.
    if (command.find("deletetags") != std::string::npos) FreeAll();
    driver_.Command(command, Length());
  }

  void FreeAll() {
    for (ITag* tag : tags_) driver_->FreeTag(tag);
    tags_.clear();
  }

  void Renew() {
    FreeAll();
    driver_.Renew();
  }

  // --- the line, the task, the storage, faults ---

  void Surroundings(unsigned int choice) {
    switch (choice % 12) {
      case 0:
        driver_.Host().Line().Feed(input_.Text());
        break;
      case 1:
        driver_.Host().Line().Silence(static_cast<long long>(input_.Byte()) * 10);
        break;
      case 2:
        driver_.Host().RunPasses(static_cast<int>(input_.Below(6)));
        break;
      case 3:
        driver_.Host().Faults().FailNth(kFaults[input_.Below(std::size(kFaults))],
                                        static_cast<int>(input_.Below(4)) + 1);
        break;
      case 4:
        driver_.Host().Faults().Clear();
        break;
      case 5:
        driver_.Host().Storage().PutString("LOKA", "rx_prefix", input_.Text());
        break;
      case 6:
        driver_.Host().Storage().SetExtended(input_.Flag());
        break;
      case 7:
        driver_->Config(FuzzedDriver::Config(Text()).c_str());
        break;
      case 8:
        driver_->Config(FuzzedDriver::Config("rx_suffix=03 token_queue_size=2").c_str());
        driver_->Start();
        break;
      case 9:
        UseTag();
        break;
      default:
        MakeTag();
        break;
    }
  }

  // --- the operations by slot ---

  void CallSlot(unsigned int slot);
  void CallInformation(unsigned int slot);
  void CallAccess(unsigned int slot);
  void CallQuestion(unsigned int slot);
  void CallUnsupported(unsigned int slot);
  void CallDatagram(unsigned int slot);

  FuzzInput& input_;
  FuzzedDriver driver_;
  std::vector<ITag*> tags_;
};

void OperationsRun::CallSlot(unsigned int slot) {
  switch (slot) {
    case 0:
    case 1:
      Renew();
      break;
    case 5:
      driver_->Config(TextOrNull(Text()));
      break;
    case 6:
      MakeTag();
      break;
    case 7:
      FreeTag();
      break;
    case 9:
      driver_->Start();
      break;
    case 10:
      Require(driver_->Stop() != 0, "Stop fails");
      break;
    case 30:
      driver_->SetIdent(TextOrNull(Text()));
      break;
    case 31:
      Command();
      break;
    default:
      CallInformation(slot);
      CallAccess(slot);
      CallQuestion(slot);
      CallUnsupported(slot);
      CallDatagram(slot);
      break;
  }
}

void OperationsRun::CallInformation(unsigned int slot) {
  switch (slot) {
    case 2: {
      const char* const name = kNames[input_.Below(std::size(kNames))];
      void* const object = driver_->ConvertTo(input_.Flag() ? name : Text().c_str());
      Require(object == nullptr || object == driver_.operator->(), "another object");
      break;
    }
    case 3:
      Require(driver_->GetImpName() != nullptr, "no name");
      break;
    case 4:
      driver_->GetImpVersion();
      break;
    case 19:
    case 20:
      Require(driver_->GetName() == driver_->GetNextInstanceName(), "two names");
      break;
    case 21:
    case 22:
      Require(driver_->GetLastErrorString() != nullptr, "no error text");
      Require(driver_->GetLastError() != 0, "an error code of zero");
      break;
    case 23:
    case 24:
    case 25:
      Require(driver_->GetProtocolVersion() == 111 && driver_->GetProtocolType() == 471,
              "another driver");
      Require(driver_->GetProtocolName() != nullptr, "no name");
      break;
    case 26: {
      const int length = Length();
      WithBuffer(length, [&](unsigned char* buffer) {
        const int written = driver_->GetInfo(reinterpret_cast<char*>(buffer), length);
        Require(written >= 0 && written <= std::max(0, length), "GetInfo writes too much");
      });
      break;
    }
    case 27:
      Require(driver_->GetXml() != nullptr, "no description");
      break;
    case 29:
      Require(driver_->GetIdent() != nullptr, "no identifier");
      break;
    case 32: {
      std::array<unsigned char, 128> record = {};
      record[0] = static_cast<unsigned char>(input_.Byte());
      driver_->Extend(static_cast<int>(input_.Byte()) - 2, input_.Flag() ? record.data() : nullptr);
      break;
    }
    case 55: {
      const int length = Length();
      WithBuffer(length, [&](unsigned char* buffer) {
        driver_->vcsGetComParams(reinterpret_cast<char*>(buffer), length);
      });
      break;
    }
    default:
      break;
  }
}

void OperationsRun::CallAccess(unsigned int slot) {
  unsigned long long stamp = 0;
  const ITag* const tag = Tag();
  const int length = Length();
  switch (slot) {
    case 11:
      WithValue(tag, [&](unsigned char* value) { driver_->Read(tag, value); });
      break;
    case 12:
      WriteValue(tag);
      break;
    case 13:
      WithBuffer(length, [&](unsigned char* buffer) { driver_->ReadBlock(tag, buffer, length); });
      break;
    case 14:
      WithBuffer(length, [&](unsigned char* buffer) {
        Require(driver_->WriteBlock(tag, buffer, length) == 0, "WriteBlock succeeds");
      });
      break;
    case 41:
      WithBuffer(length, [&](unsigned char* buffer) {
        driver_->ReadBitBlock(tag, buffer, BitsOf(length));
      });
      break;
    case 51:
      WithBuffer(length, [&](unsigned char* buffer) {
        driver_->WriteBitBlock(tag, buffer, BitsOf(length));
      });
      break;
    case 72:
      WithValue(tag, [&](unsigned char* value) {
        const int result = driver_->readWithTimestamp(tag, value, input_.Flag() ? &stamp : nullptr);
        Require(result != 0 || stamp == 0, "a failed read has a time stamp");
      });
      break;
    case 73:
      WithBuffer(length, [&](unsigned char* buffer) {
        driver_->readBlockWithTimestamp(tag, buffer, length, input_.Flag() ? &stamp : nullptr);
      });
      break;
    case 79:
    case 80:
      if (tag != nullptr && tag->GetVarLength() > FuzzedDriver::kLongestValueBytes) break;
      WithBuffer(16, [&](unsigned char* item) {
        if (slot == 79) {
          driver_->readArrayItem(tag, length, item);
        } else {
          driver_->writeArrayItem(tag, length, item);
        }
      });
      break;
    case 81:
      WithBuffer(length, [&](unsigned char* buffer) {
        driver_->readBitBlockWithTimestamp(tag, buffer, BitsOf(length), &stamp);
      });
      break;
    default:
      break;
  }
}

void OperationsRun::CallQuestion(unsigned int slot) {
  const ITag* const first = Tag();
  const ITag* const second = Tag();
  switch (slot) {
    case 8:
      Require(!driver_->CanBeOptimized(first, second, true), "writes are optimised");
      driver_->CanBeOptimized(first, second, false);
      break;
    case 15:
    case 16:
      Require(driver_->MaxDatagramItems(first) + driver_->MaxDatagramLength(first) == 0,
              "datagrams");
      break;
    case 17:
      driver_->CanCoexistInDatagram(first, second);
      break;
    case 28:
      Require(!driver_->IsConverted(), "converted");
      break;
    case 39:
      driver_->GetNodeID(first);
      break;
    case 40:
      Require(!driver_->CanReadBitBlock(first), "bit blocks");
      break;
    case 43:
      driver_->MaxUnusedGap(first);
      break;
    case 44:
      Require(!driver_->IsBefore(first, first), "before itself");
      driver_->IsBefore(first, second);
      break;
    case 45:
      driver_->IsAdjacent(first, second);
      break;
    case 46:
    case 47:
    case 50:
      Require(!driver_->NeedsReadBeforeWrite(first) && !driver_->CanWriteDatagrams(first) &&
                  !driver_->CanWriteBitBlock(first),
              "something that the driver has not");
      break;
    case 71:
      Require(!driver_->hasPlcTimestamp(first), "a time stamp of the device");
      break;
    case 75:
    case 76:
    case 77: {
      const int index = input_.Int();
      const char* const name = driver_->getTagUriFieldName(index);
      Require((name != nullptr) == (index >= 0 && index < driver_->getTagUriFieldCount()),
              "fields");
      Require(name == nullptr || driver_->getTagUriFieldPosition(name) == index, "positions");
      driver_->getTagUriFieldPosition(TextOrNull(Text()));
      break;
    }
    case 78: {
      int length = 0;
      const char* const field = driver_->getTagUriField(first, static_cast<int>(input_.Byte()) - 1,
                                                        input_.Flag() ? &length : nullptr);
      Require(field != nullptr || length == 0, "a length without a field");
      break;
    }
    case 82: {
      const std::unique_ptr<TagBase> tag(
          static_cast<ProtocolBase*>(driver_->ConvertTo("ProtocolBase"))
              ->CreateTagBase(TextOrNull(Text())));
      break;
    }
    case 83:
    case 84: {
      const auto* const base = static_cast<ProtocolBase*>(driver_->ConvertTo("ProtocolBase"));
      Require(base->GetMaxTm(first) == 0 && base->tagUriNames() != nullptr, "driver's own slots");
      break;
    }
    default:
      break;
  }
}

void OperationsRun::CallUnsupported(unsigned int slot) {
  unsigned long long last = 0;
  switch (slot) {
    case 35:
    case 36:
      Require(!driver_->MultipleReadSupported() && driver_->MultipleRead(nullptr) == 0, "35");
      break;
    case 37:
    case 38:
      Require(!driver_->MultipleWriteSupported() && driver_->MultipleWrite(nullptr) == 0, "37");
      break;
    case 42:
      Require(driver_->GetInterface(TextOrNull(Text())) == nullptr, "42");
      break;
    case 52:
      Require(!driver_->readObject(Tag(), nullptr), "52");
      break;
    case 53:
      Require(!driver_->writeObject(Tag(), nullptr), "53");
      break;
    case 54:
    case 56:
      driver_->vcsGetCapability();
      Require(driver_->vcsActivateInterleaved(static_cast<unsigned short>(input_.Byte())) == 0,
              "56");
      break;
    case 57:
      Require(driver_->createEventChannel(input_.Int()) == nullptr, "57");
      break;
    case 58:
      Require(driver_->createEventChannel(static_cast<IEventProcessor*>(nullptr)) == nullptr, "58");
      break;
    case 59:
      driver_->deleteEventChannel(nullptr);
      break;
    case 60:
    case 61:
      Require(driver_->addEventSource(nullptr, TextOrNull(Text())) == 0, "60");
      Require(driver_->addAlarmEvents(nullptr, nullptr) == 0, "61");
      break;
    case 62:
    case 63:
      Require(driver_->frontEvent(nullptr) == nullptr, "62");
      driver_->popEvent(nullptr);
      break;
    case 64:
    case 65:
      Require(driver_->createAlarm(TextOrNull(Text())) == nullptr, "64");
      driver_->deleteAlarm(nullptr);
      break;
    case 66:
    case 67:
      Require(driver_->listAlarms(nullptr) + driver_->quitAlarm(nullptr) == 0, "66");
      break;
    case 68:
    case 69:
      Require(driver_->createTrend(TextOrNull(Text())) == nullptr, "68");
      driver_->deleteTrend(nullptr);
      break;
    case 70:
      Require(driver_->readTrend(nullptr, 0, 1, last, 2, input_.Flag(), nullptr) == 0, "70");
      break;
    default:
      break;
  }
}

void OperationsRun::CallDatagram(unsigned int slot) {
  const std::array<const ITag*, 3> tags = {Tag(), Tag(), Tag()};
  std::array<idal_error_t, 3> status = {};
  std::array<unsigned long long, 3> stamps = {};
  const auto count = static_cast<int>(input_.Below(4));
  if (std::find(tags.begin(), tags.begin() + count, nullptr) != tags.begin() + count) return;
  WithBuffer(64, [&](unsigned char* buffer) {
    switch (slot) {
      case 18:
        driver_->ReadDatagram(tags.data(), count, buffer);
        break;
      case 33:
        driver_->CanAddToDatagram(tags.data(), count, Tag());
        break;
      case 34:
        driver_->ReadDatagramWithStatus(tags.data(), count, buffer, status.data());
        break;
      case 48:
        driver_->CanAddToWriteDatagram(tags.data(), count, Tag());
        break;
      case 49:
        driver_->WriteDatagramWithStatus(tags.data(), count, buffer, status.data());
        break;
      case 74:
        driver_->readDatagramWithTimestamp(tags.data(), count, buffer, status.data(),
                                           stamps.data());
        break;
      default:
        break;
    }
  });
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
  FuzzInput input(data, size);
  OperationsRun run(input);
  while (!input.IsEmpty()) run.Step();
  return 0;
}
