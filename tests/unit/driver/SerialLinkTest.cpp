// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <atomic>
#include <condition_variable>
#include <functional>
#include <memory>
#include <mutex>
#include <new>
#include <string>
#include <thread>
#include <vector>

#include "driver/SerialLink.h"
#include "interfaces/ISerialFactory.h"
#include "interfaces/ISerialPort.h"
#include "tests/unit/FailingNew.h"

namespace {

// Opens once and stays open.
class Gate {
 public:
  void Open() {
    const std::lock_guard<std::mutex> lock(mutex_);
    isOpen_ = true;
    changed_.notify_all();
  }
  void Pass() {
    std::unique_lock<std::mutex> lock(mutex_);
    changed_.wait(lock, [this] { return isOpen_; });
  }

 private:
  std::mutex mutex_;
  std::condition_variable changed_;
  bool isOpen_ = false;
};

// A port that lets the test act inside each of its operations.
class HookedPort final : public ISerialPort {
 public:
  void* ConvertTo(const char* /*name*/) override { return nullptr; }
  void reserved3() override {}
  void reserved4() override {}
  int Setup(int baudrate, int parity, int dataBits, int stopBits, int mode) override {
    setup = {baudrate, parity, dataBits, stopBits, mode};
    ++setups;
    if (inSetup) inSetup();
    return setupResult;
  }
  int Send(const unsigned char* data, int lengthBytes, int timeoutMs) override {
    sent.assign(data, data + lengthBytes);
    sendTimeoutMs = timeoutMs;
    ++sends;
    if (inSend) inSend();
    return sendResult;
  }
  int Receive(unsigned char* byte, int timeoutMs, int reserved) override {
    receiveTimeoutMs = timeoutMs;
    receiveReserved = reserved;
    if (inReceive) inReceive();
    if (next < 0) return 0;
    *byte = static_cast<unsigned char>(next);
    return 1;
  }

  std::function<void()> inSetup;
  std::function<void()> inSend;
  std::function<void()> inReceive;
  SerialSettings setup;
  int setups = 0;
  int setupResult = 1;
  std::string sent;
  int sends = 0;
  int sendResult = 1;
  int sendTimeoutMs = -1;
  int receiveTimeoutMs = -1;
  int receiveReserved = -1;
  int next = -1;
  std::atomic<int> releases{0};
};

// Hands out the ports in order; they stay in memory after their release.
class HookedFactory final : public ISerialFactory {
 public:
  HookedFactory() { ports.emplace_back(std::make_unique<HookedPort>()); }
  void* ConvertTo(const char* /*name*/) override { return nullptr; }
  const char* GetImpName() const override { return "Hooked"; }
  int GetImpVersion() const override { return 1; }
  ISerialPort* OpenPort(const char* name) override {
    names.emplace_back(name);
    if (inOpen) {
      const std::function<void()> once = std::move(inOpen);
      inOpen = nullptr;
      once();
    }
    if (!opens) return nullptr;
    const std::size_t index = opened++;
    while (ports.size() <= index) ports.push_back(std::make_unique<HookedPort>());
    return ports[index].get();
  }
  void ReleasePort(ISerialPort* port) override { ++static_cast<HookedPort*>(port)->releases; }

  HookedPort& Port(std::size_t index = 0) { return *ports[index]; }
  int OpenCount() const {
    int count = static_cast<int>(opened);
    for (const auto& port : ports) count -= port->releases;
    return count;
  }

  std::function<void()> inOpen;
  std::vector<std::unique_ptr<HookedPort>> ports;
  std::vector<std::string> names;
  std::size_t opened = 0;
  bool opens = true;
};

const SerialSettings kSettings = {9600, 1, 8, 2, 0};
const SerialSettings kOtherSettings = {300, 0, 7, 1, 1};

using Received = SerialLink::ReceiveResult;

class SerialLinkTest : public testing::Test {
 protected:
  HookedFactory factory_;
  SerialLink link_{&factory_};
  unsigned char byte_ = 0x5A;
};

}  // namespace

// --- opening ---

TEST_F(SerialLinkTest, StartsClosed) {
  EXPECT_FALSE(link_.IsConnected());
  EXPECT_FALSE(link_.Send("x"));
  link_.Setup(kSettings);
  link_.Close();
  link_.CloseWithoutSemaphore();
  const SerialLink::ReceivePass pass(link_);
  EXPECT_EQ(link_.Receive(byte_, 500), Received::kClosed);
  EXPECT_EQ(factory_.opened, 0U);
}

TEST_F(SerialLinkTest, OpensTheNamedPortAndSetsItUp) {
  EXPECT_TRUE(link_.Open("com7", kSettings));
  EXPECT_TRUE(link_.IsConnected());
  EXPECT_EQ(factory_.names, std::vector<std::string>{"com7"});
  EXPECT_TRUE(factory_.Port().setup == kSettings);
  EXPECT_EQ(factory_.Port().setups, 1);
  link_.Close();
}

TEST_F(SerialLinkTest, OpeningAnOpenLinkDoesNothing) {
  EXPECT_TRUE(link_.Open("com7", kSettings));
  EXPECT_TRUE(link_.Open("com8", kOtherSettings));
  EXPECT_EQ(factory_.names.size(), 1U);
  EXPECT_EQ(factory_.Port().setups, 1);
  link_.Close();
}

TEST_F(SerialLinkTest, PortThatCannotBeOpened) {
  factory_.opens = false;
  EXPECT_FALSE(link_.Open("com7", kSettings));
  EXPECT_FALSE(link_.IsConnected());
  EXPECT_FALSE(link_.Send("x"));
}

TEST_F(SerialLinkTest, PortThatCannotBeSetUpIsReleased) {
  factory_.Port().setupResult = 0;
  EXPECT_FALSE(link_.Open("com7", kSettings));
  EXPECT_FALSE(link_.IsConnected());
  EXPECT_EQ(factory_.Port().releases, 1);
  // And may be tried again.
  EXPECT_TRUE(link_.Open("com7", kSettings));
  EXPECT_EQ(factory_.OpenCount(), 1);
  link_.Close();
}

TEST_F(SerialLinkTest, NoFactoryNoPort) {
  SerialLink link(nullptr);
  EXPECT_FALSE(link.Open("com7", kSettings));
  EXPECT_FALSE(link.IsConnected());
  link.Close();
}

TEST_F(SerialLinkTest, SecondOfTwoOpeningsAtOnceIsSurplus) {
  // A second thread opens the link while the host opens the port for the first one.
  factory_.inOpen = [this] { EXPECT_TRUE(link_.Open("com7", kSettings)); };
  EXPECT_TRUE(link_.Open("com7", kSettings));
  EXPECT_EQ(factory_.opened, 2U);
  EXPECT_EQ(factory_.OpenCount(), 1);
  EXPECT_EQ(factory_.Port(0).releases, 0);
  EXPECT_EQ(factory_.Port(1).releases, 1);
  EXPECT_TRUE(link_.Send("x"));
  EXPECT_EQ(factory_.Port(0).sent, "x");
  link_.Close();
  EXPECT_EQ(factory_.OpenCount(), 0);
}

// --- closing ---

TEST_F(SerialLinkTest, CloseReleasesThePortOnce) {
  link_.Open("com7", kSettings);
  link_.Close();
  EXPECT_FALSE(link_.IsConnected());
  EXPECT_EQ(factory_.Port().releases, 1);
  link_.Close();
  link_.CloseWithoutSemaphore();
  EXPECT_EQ(factory_.Port().releases, 1);
}

TEST_F(SerialLinkTest, ClosedLinkOpensAgain) {
  link_.Open("com7", kSettings);
  link_.Close();
  EXPECT_TRUE(link_.Open("com7", kOtherSettings));
  EXPECT_TRUE(factory_.Port(1).setup == kOtherSettings);
  link_.Close();
  EXPECT_EQ(factory_.OpenCount(), 0);
}

TEST_F(SerialLinkTest, DisconnectKeepsThePortUntilClose) {
  link_.Open("com7", kSettings);
  link_.Disconnect();
  EXPECT_FALSE(link_.IsConnected());
  EXPECT_EQ(factory_.Port().releases, 0);
  const SerialLink::ReceivePass pass(link_);
  EXPECT_EQ(link_.Receive(byte_, 500), Received::kClosed);
  link_.Close();
  EXPECT_EQ(factory_.Port().releases, 1);
}

TEST_F(SerialLinkTest, CloseWithoutSemaphoreReleasesAtOnceWhenNoPassRuns) {
  link_.Open("com7", kSettings);
  link_.CloseWithoutSemaphore();
  EXPECT_FALSE(link_.IsConnected());
  EXPECT_EQ(factory_.Port().releases, 1);
}

TEST_F(SerialLinkTest, RunningPassKeepsThePortThatIsClosedUnderIt) {
  link_.Open("com7", kSettings);
  {
    const SerialLink::ReceivePass pass(link_);
    factory_.Port().inReceive = [this] {
      link_.CloseWithoutSemaphore();
      EXPECT_FALSE(link_.IsConnected());
      EXPECT_EQ(factory_.Port().releases, 0);
    };
    EXPECT_EQ(link_.Receive(byte_, 500), Received::kTimeout);
    EXPECT_EQ(link_.Receive(byte_, 500), Received::kClosed);
    EXPECT_FALSE(link_.Send("x"));
    EXPECT_EQ(factory_.Port().releases, 0);
  }
  EXPECT_EQ(factory_.Port().releases, 1);
}

TEST_F(SerialLinkTest, RunningPassKeepsEveryPortThatIsClosedUnderIt) {
  {
    const SerialLink::ReceivePass pass(link_);
    for (int i = 0; i < 3; ++i) {
      EXPECT_TRUE(link_.Open("com7", kSettings));
      link_.CloseWithoutSemaphore();
    }
    EXPECT_EQ(factory_.OpenCount(), 3);
  }
  EXPECT_EQ(factory_.OpenCount(), 0);
  for (const auto& port : factory_.ports) EXPECT_EQ(port->releases, 1);
}

TEST_F(SerialLinkTest, CloseUnderTheSemaphoreReleasesAtOnceEvenInAPass) {
  link_.Open("com7", kSettings);
  const SerialLink::ReceivePass pass(link_);
  link_.Close();
  EXPECT_EQ(factory_.Port().releases, 1);
}

TEST_F(SerialLinkTest, KeepingThePortForAPassNeedsNoMemory) {
  link_.Open("com7", kSettings);
  {
    const SerialLink::ReceivePass pass(link_);
    {
      const FailingNew noMemory(1);
      link_.CloseWithoutSemaphore();
      EXPECT_FALSE(noMemory.HasFailed());
    }
    EXPECT_EQ(factory_.Port().releases, 0);
  }
  EXPECT_EQ(factory_.Port().releases, 1);
}

TEST_F(SerialLinkTest, WithoutMemoryNothingIsOpened) {
  {
    const FailingNew noMemory(1);
    EXPECT_THROW(link_.Open("com7", kSettings), std::bad_alloc);
    EXPECT_TRUE(noMemory.HasFailed());
  }
  EXPECT_FALSE(link_.IsConnected());
  EXPECT_EQ(factory_.OpenCount(), 0);
  EXPECT_TRUE(link_.Open("com7", kSettings));
}

// --- set-up, send, receive ---

TEST_F(SerialLinkTest, SetsAnOpenPortUpAgain) {
  link_.Open("com7", kSettings);
  factory_.Port().setupResult = 0;  // of no account
  link_.Setup(kOtherSettings);
  EXPECT_TRUE(factory_.Port().setup == kOtherSettings);
  EXPECT_EQ(factory_.Port().setups, 2);
  EXPECT_TRUE(link_.IsConnected());
  link_.Close();
  link_.Setup(kSettings);
  EXPECT_EQ(factory_.Port().setups, 2);
}

TEST_F(SerialLinkTest, HandsTheBytesToThePort) {
  link_.Open("com7", kSettings);
  const std::string bytes("a\0\xFF", 3);
  EXPECT_TRUE(link_.Send(bytes));
  EXPECT_EQ(factory_.Port().sent, bytes);
  EXPECT_EQ(factory_.Port().sendTimeoutMs, 0);
  EXPECT_TRUE(link_.Send(""));
  EXPECT_EQ(factory_.Port().sends, 2);
  factory_.Port().sendResult = 0;  // of no account
  EXPECT_TRUE(link_.Send("x"));
  link_.Close();
}

TEST_F(SerialLinkTest, ReceivesOneByte) {
  link_.Open("com7", kSettings);
  const SerialLink::ReceivePass pass(link_);
  factory_.Port().next = 0xFE;
  EXPECT_EQ(link_.Receive(byte_, 123), Received::kByte);
  EXPECT_EQ(byte_, 0xFE);
  EXPECT_EQ(factory_.Port().receiveTimeoutMs, 123);
  EXPECT_EQ(factory_.Port().receiveReserved, 0);
  factory_.Port().next = -1;
  EXPECT_EQ(link_.Receive(byte_, 123), Received::kTimeout);
  link_.Close();
}

// --- a send and a close at once ---

namespace {

// Lets another thread close the link while the first one is inside a use of the port, and gives it
// every chance to release the port too early.
template <typename Use, typename CloseLink>
void ExpectUseOutlivesClose(HookedFactory& factory, std::function<void()>& hook, Use use,
                            CloseLink closeLink) {
  Gate inside;
  std::atomic<bool> isClosing{false};
  std::atomic<bool> releasedInside{false};
  hook = [&] {
    inside.Open();
    while (!isClosing) std::this_thread::yield();
    for (int i = 0; i < 2000; ++i) {
      if (factory.Port().releases != 0) releasedInside = true;
      std::this_thread::yield();
    }
  };
  std::thread closer([&] {
    inside.Pass();
    isClosing = true;
    closeLink();
  });
  use();
  closer.join();
  EXPECT_FALSE(releasedInside);
  EXPECT_EQ(factory.Port().releases, 1);
}

}  // namespace

TEST_F(SerialLinkTest, SendKeepsThePortWhileAnotherThreadClosesIt) {
  link_.Open("com7", kSettings);
  ExpectUseOutlivesClose(
      factory_, factory_.Port().inSend, [this] { EXPECT_TRUE(link_.Send("x")); },
      [this] { link_.Close(); });
}

TEST_F(SerialLinkTest, SendKeepsThePortWhileAnotherThreadStops) {
  link_.Open("com7", kSettings);
  ExpectUseOutlivesClose(
      factory_, factory_.Port().inSend, [this] { EXPECT_TRUE(link_.Send("x")); },
      [this] { link_.CloseWithoutSemaphore(); });
}

TEST_F(SerialLinkTest, SetupKeepsThePortWhileAnotherThreadClosesIt) {
  link_.Open("com7", kSettings);
  ExpectUseOutlivesClose(
      factory_, factory_.Port().inSetup, [this] { link_.Setup(kOtherSettings); },
      [this] { link_.Close(); });
}
