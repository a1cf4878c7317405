// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>

#include "driver/CreateProtocol_LOKA.h"
#include "driver/Protocol_LOKA.h"
#include "interfaces/ITag.h"
#include "tests/unit/Bytes.h"
#include "tests/unit/FailingNew.h"
#include "tests/unit/QuietHost.h"

// The nth allocation of an operation fails, for every n: nothing escapes to the host, no semaphore
// stays held, what was held before is still there, and the operation works once memory is back.

namespace {

// Texts that are too long for a small string, so that copies of them allocate.
const std::string kHexText(40, 'A');
const std::string kMemoryConfig =
    "CfgVer=1 model=1 port=/dev/serial/by-id/a-rather-long-name baudrate=9600 parity=even bits=8 "
    "stopbits=1 mode=RS-232 Node1::model=1 rx_prefix=02 rx_suffix=03 tx_prefix=" +
    kHexText + " tx_suffix=" + kHexText + " token_queue_size=100";

class Protocol_LOKAMemoryTest : public testing::Test {
 protected:
  void MakeStarted() {
    protocol_.reset();
    protocol_ = std::make_unique<Protocol_LOKA>();
    ASSERT_NE(protocol_->Config(kMemoryConfig.c_str()), 0);
    ASSERT_NE(protocol_->Start(), 0);
  }

  ITag* Tag(const char* uri) {
    ITag* const tag = protocol_->CreateTag(uri);
    EXPECT_NE(tag, nullptr) << uri;
    return tag;
  }

  void Receive(const std::string& line) {
    host_.SetLine(line.data(), line.size());
    protocol_->Task();
  }

  // A conversion that has no memory for its work buffer fails as a conversion.
  void ExpectMemoryError(int nth) {
    const bool isConversion = protocol_->GetLastError() == -9;
    EXPECT_EQ(protocol_->GetLastError(), isConversion ? -9 : -1) << nth;
    const std::string text = protocol_->GetLastErrorString();
    if (isConversion) {
      EXPECT_TRUE(text == "read conversion error" || text == "write conversion error") << text;
    } else {
      EXPECT_EQ(text, "Out of memory") << nth;
    }
  }

  // Runs the operation with a failure at each of its allocations. `operation` gives its result; a
  // failure has to be a zero result. Returns the number of allocations.
  int FailEach(const std::function<void()>& prepare, const std::function<int()>& operation) {
    for (int nth = 1;; ++nth) {
      prepare();
      int result = 0;
      bool hasFailed = false;
      {
        const FailingNew noMemory(nth);
        result = operation();
        hasFailed = noMemory.HasFailed();
      }
      EXPECT_EQ(host_.HeldSemaphores(), 0) << nth;
      if (!hasFailed) {
        EXPECT_NE(result, 0);
        return nth - 1;
      }
      if (result == 0) {
        ExpectMemoryError(nth);
        EXPECT_NE(operation(), 0) << "with memory again, after " << nth;
      }
    }
  }

  QuietHost host_;
  std::unique_ptr<Protocol_LOKA> protocol_;
};

}  // namespace

TEST_F(Protocol_LOKAMemoryTest, Create) {
  for (int nth = 1;; ++nth) {
    const FailingNew noMemory(nth);
    IProtocol* protocol = nullptr;
    bool threw = false;
    try {
      protocol = CreateProtocol_LOKA();
    } catch (const std::bad_alloc&) {
      threw = true;
    }
    EXPECT_EQ(threw, noMemory.HasFailed()) << nth;
    if (!noMemory.HasFailed()) {
      EXPECT_GT(nth, 1);
      delete protocol;
      break;
    }
    EXPECT_EQ(host_.Outstanding(), 0) << nth;
  }
  EXPECT_EQ(host_.Outstanding(), 0);
}

TEST_F(Protocol_LOKAMemoryTest, Config) {
  const int allocations = FailEach([this] { protocol_ = std::make_unique<Protocol_LOKA>(); },
                                   [this] { return protocol_->Config(kMemoryConfig.c_str()); });
  EXPECT_GT(allocations, 5);
}

TEST_F(Protocol_LOKAMemoryTest, Start) {
  const int allocations = FailEach(
      [this] {
        protocol_ = std::make_unique<Protocol_LOKA>();
        ASSERT_NE(protocol_->Config(kMemoryConfig.c_str()), 0);
      },
      [this] { return protocol_->Start(); });
  EXPECT_GT(allocations, 5);
  protocol_->Stop();
  protocol_.reset();
  EXPECT_EQ(host_.Outstanding(), 0);
}

TEST_F(Protocol_LOKAMemoryTest, SendingAToken) {
  MakeStarted();
  const ITag* const tag = Tag("0?tx_token?string-300");
  Bytes value(300, 'A');
  value[200] = 0;
  const int allocations = FailEach([] {}, [&] { return protocol_->Write(tag, value.data()); });
  EXPECT_GT(allocations, 2);
  const int before = host_.SentBytes();
  EXPECT_NE(protocol_->Write(tag, value.data()), 0);
  EXPECT_EQ(host_.SentBytes() - before, 20 + 200 + 20);
}

TEST_F(Protocol_LOKAMemoryTest, ReadingAToken) {
  MakeStarted();
  const std::string token(300, 'T');
  const ITag* const tag = Tag("0?rx_token?string-400");
  Receive("\x02" + token + "\x03");
  Bytes value(400);
  const int allocations = FailEach([] {}, [&] { return protocol_->Read(tag, value.data()); });
  EXPECT_GT(allocations, 2);
  EXPECT_EQ(reinterpret_cast<const char*>(value.data()), token);
}

TEST_F(Protocol_LOKAMemoryTest, StagingATextAndReadingItBack) {
  MakeStarted();
  const ITag* const tag = Tag("0?SP_RxPrefix?string-300");
  Bytes value(300);
  for (int i = 0; i < 100; ++i) value[static_cast<std::size_t>(i)] = '0';
  EXPECT_GT(FailEach([] {}, [&] { return protocol_->Write(tag, value.data()); }), 1);
  Bytes readBack(300);
  EXPECT_GT(FailEach([] {}, [&] { return protocol_->Read(tag, readBack.data()); }), 1);
  EXPECT_EQ(readBack, value);
}

TEST_F(Protocol_LOKAMemoryTest, StagingANumberAndASwitch) {
  MakeStarted();
  const ITag* const queueSize = Tag("0?SP_TokenQueueSize?unsignedInt");
  const ITag* const hexTokens = Tag("0?SP_HexTokens?boolean");
  const Bytes number = BytesOf(7);
  const unsigned char on = 1;
  EXPECT_GT(FailEach([] {}, [&] { return protocol_->Write(queueSize, number.data()); }), 0);
  EXPECT_GT(FailEach([] {}, [&] { return protocol_->Write(hexTokens, &on); }), 0);
}

TEST_F(Protocol_LOKAMemoryTest, ApplyingTheStagedSettings) {
  const unsigned char on = 1;
  const ITag* done = nullptr;
  const int allocations = FailEach(
      [&] {
        MakeStarted();
        Bytes text(300);
        for (int i = 0; i < 100; ++i) text[static_cast<std::size_t>(i)] = '0';
        EXPECT_NE(protocol_->Write(Tag("0?SP_TxPrefix?string-300"), text.data()), 0);
        EXPECT_NE(protocol_->Write(Tag("0?SP_Gap?unsignedInt"), BytesOf(25).data()), 0);
        done = Tag("0?SP_Done?boolean");
      },
      [&] { return protocol_->Write(done, &on); });
  EXPECT_GT(allocations, 5);
}

TEST_F(Protocol_LOKAMemoryTest, ReceivingATokenKeepsTheOthers) {
  MakeStarted();
  Receive("\x02kept\x03");
  const ITag* const available = Tag("0?tokens_available?unsignedInt");
  const ITag* const front = Tag("0?rx_token?string-20");
  const std::string line = "\x02" + std::string(200, 'T') + "\x03";
  Bytes value(20);
  int queued = 1;
  for (int nth = 1;; ++nth) {
    host_.SetLine(line.data(), line.size());
    bool hasFailed = false;
    {
      const FailingNew noMemory(nth);
      protocol_->Task();
      hasFailed = noMemory.HasFailed();
    }
    EXPECT_EQ(host_.HeldSemaphores(), 0) << nth;
    queued += hasFailed ? 0 : 1;
    EXPECT_NE(protocol_->Read(available, value.data()), 0);
    EXPECT_EQ(NumberIn<int>(value.data()), queued) << nth;
    EXPECT_NE(protocol_->Read(front, value.data()), 0);
    EXPECT_STREQ(reinterpret_cast<const char*>(value.data()), "kept") << nth;
    if (!hasFailed) {
      EXPECT_GT(nth, 1);
      break;
    }
  }
}

TEST_F(Protocol_LOKAMemoryTest, CommunicationParameters) {
  MakeStarted();
  char text[200];
  EXPECT_GT(FailEach([] {}, [&] { return protocol_->vcsGetComParams(text, 200); }), 0);
}
