// SPDX-License-Identifier: Apache-2.0
// A host made of bare tables of functions: whatever the interface headers say, the plug-in must
// call the agreed slots. Every slot that it has no business with ends the test with its number.
#include <gtest/gtest.h>

#include <array>
#include <cstring>
#include <string>
#include <utility>

#include "tests/abi/RawTable.h"
#include "tests/support/PluginLibrary.h"

namespace {

constexpr int kSlots = 16;

// An object as it crosses the boundary: the table pointer, then whatever its owner likes.
struct Object {
  const Slot* table;
  const char* name;
};

std::string calls;
void* runner = nullptr;
int endsAfter = 0;
std::string line;
bool extendedStorage = false;

void Note(const std::string& call) { calls += call + "\n"; }

template <int kSlot>
void Wrong(Object* self) {
  Note(std::string("WRONG ") + self->name + " slot " + std::to_string(kSlot));
}

template <int... kNumbers>
std::array<Slot, kSlots> WrongTable(std::integer_sequence<int, kNumbers...> /*numbers*/) {
  return {{reinterpret_cast<Slot>(&Wrong<kNumbers>)...}};
}

// A table in which every slot is wrong but the given ones.
class Table {
 public:
  Table() : slots_(WrongTable(std::make_integer_sequence<int, kSlots>())) {}
  template <class Function>
  Table& Set(std::size_t slot, Function function) {
    slots_[slot] = reinterpret_cast<Slot>(function);
    return *this;
  }
  const Slot* Get() const { return slots_.data(); }

 private:
  std::array<Slot, kSlots> slots_;
};

Object queueSemaphore;
Object portSemaphore;
Object task;
Object port;
Object multiTask;
Object serialFactory;
Object socketFactory;
Object cdsBuffer;
Object diag;
Object storage;
Object storage2;
Object driverInterface;
Object smux;
Object fastTimer;
Object hostFactory;
int semaphores = 0;

std::string TextOf(const char* text) { return text != nullptr ? text : "(null)"; }

void* CreateInterface(Object* /*self*/, const char* name) {
  Note("create " + TextOf(name));
  for (Object* object : {&multiTask, &serialFactory, &socketFactory, &cdsBuffer, &diag, &storage,
                         &driverInterface, &smux, &fastTimer}) {
    if (std::strcmp(object->name, name) == 0) return object;
  }
  return nullptr;
}
void ReleaseInterface(Object* /*self*/, Object* object) { Note("release " + TextOf(object->name)); }

int StopTask(Object* /*self*/, Object* stopped, int timeoutMs) {
  Note("stop " + TextOf(stopped->name) + " " + std::to_string(timeoutMs));
  return 1;
}
void* CreateSemaphore(Object* /*self*/, int argument) {
  Note("semaphore " + std::to_string(argument));
  return semaphores++ % 2 == 0 ? &queueSemaphore : &portSemaphore;
}
void DeleteSemaphore(Object* /*self*/, Object* semaphore) {
  Note("delete " + TextOf(semaphore->name));
}
void Sleep(Object* /*self*/, int milliseconds) { Note("sleep " + std::to_string(milliseconds)); }
void* CreateTask(Object* /*self*/, void* taskRunner, int taskClass) {
  runner = taskRunner;
  Note("task " + std::to_string(taskClass));
  return &task;
}

int IsToEnd(Object* /*self*/) {
  Note("to end?");
  return endsAfter-- > 0 ? 0 : 1;
}
int StartTask(Object* /*self*/) {
  Note("start task");
  return 1;
}

int Lock(Object* self) {
  Note(TextOf(self->name) + " lock");
  return 1;
}
int Unlock(Object* self) {
  Note(TextOf(self->name) + " unlock");
  return 1;
}

void* OpenPort(Object* /*self*/, const char* name) {
  Note("open " + TextOf(name));
  return &port;
}
void ReleasePort(Object* /*self*/, Object* released) { Note("release " + TextOf(released->name)); }

int SetupPort(Object* /*self*/, int baudrate, int parity, int bits, int stop, int mode) {
  Note("setup " + std::to_string(baudrate) + " " + std::to_string(parity) + " " +
       std::to_string(bits) + " " + std::to_string(stop) + " " + std::to_string(mode));
  return 1;
}
int Send(Object* /*self*/, const unsigned char* data, int length, int timeoutMs) {
  Note("send " + std::string(data, data + length) + " " + std::to_string(timeoutMs));
  return 1;
}
int Receive(Object* /*self*/, unsigned char* byte, int timeoutMs, int argument) {
  Note("receive " + std::to_string(timeoutMs) + " " + std::to_string(argument));
  if (line.empty()) return 0;
  *byte = static_cast<unsigned char>(line[0]);
  line.erase(0, 1);
  return 1;
}

void* ConvertStorage(Object* /*self*/, const char* name) {
  Note("convert " + TextOf(name));
  return extendedStorage ? &storage2 : nullptr;
}
void SetString(Object* /*self*/, const char* ident, const char* key, const char* text) {
  Note("set string " + TextOf(ident) + " " + TextOf(key) + " " + TextOf(text));
}
void SetBoolean(Object* /*self*/, const char* ident, const char* key, bool value) {
  Note("set boolean " + TextOf(ident) + " " + TextOf(key) + (value ? " true" : " false"));
}
void SetInteger(Object* /*self*/, const char* ident, const char* key, int value) {
  Note("set integer " + TextOf(ident) + " " + TextOf(key) + " " + std::to_string(value));
}
const char* GetString(Object* /*self*/, const char* ident, const char* key) {
  Note("get string " + TextOf(ident) + " " + TextOf(key));
  return "03";
}
bool GetBoolean(Object* /*self*/, const char* ident, const char* key) {
  Note("get boolean " + TextOf(ident) + " " + TextOf(key));
  return false;
}
int GetInteger(Object* /*self*/, const char* ident, const char* key) {
  Note("get integer " + TextOf(ident) + " " + TextOf(key));
  return 4800;
}
int Exists(Object* /*self*/, const char* /*ident*/, const char* key) {
  const std::string name = TextOf(key);
  return name == "baud" || name == "rx_suffix" || name == "hex_tokens" ? 1 : 0;
}
int GetStringInto(Object* /*self*/, const char* ident, const char* key, char* buffer, int size) {
  Note("get string into " + TextOf(ident) + " " + TextOf(key) + " " + std::to_string(size));
  std::memcpy(buffer, "03", 3);
  return 1;
}

class HostSlotsTest : public ::testing::Test {
 protected:
  void SetUp() override {
    calls.clear();
    line.clear();
    semaphores = 0;
    endsAfter = 0;
    extendedStorage = false;
    factory_.Set(0, CreateInterface).Set(1, ReleaseInterface);
    multiTask_.Set(6, StopTask)
        .Set(7, CreateSemaphore)
        .Set(8, DeleteSemaphore)
        .Set(9, Sleep)
        .Set(13, CreateTask);
    task_.Set(3, IsToEnd).Set(5, StartTask);
    semaphore_.Set(3, Lock).Set(4, Unlock);
    serial_.Set(5, OpenPort).Set(6, ReleasePort);
    port_.Set(5, SetupPort).Set(6, Send).Set(7, Receive);
    storage_.Set(2, ConvertStorage)
        .Set(5, SetString)
        .Set(6, SetBoolean)
        .Set(7, SetInteger)
        .Set(8, GetString)
        .Set(9, GetBoolean)
        .Set(10, GetInteger)
        .Set(11, Exists);
    storage2_.Set(12, GetStringInto);
    hostFactory = {factory_.Get(), "host factory"};
    multiTask = {multiTask_.Get(), "IMultiTask2"};
    serialFactory = {serial_.Get(), "ISerialFactory"};
    socketFactory = {nothing_.Get(), "ISocketFactory"};
    cdsBuffer = {nothing_.Get(), "ICDSBuffer"};
    diag = {nothing_.Get(), "IDiag"};
    storage = {storage_.Get(), "IPermanentStorage"};
    storage2 = {storage2_.Get(), "IPermanentStorage2"};
    driverInterface = {nothing_.Get(), "IDriverInterface"};
    smux = {nothing_.Get(), "ISmux"};
    fastTimer = {nothing_.Get(), "IFastTimer"};
    queueSemaphore = {semaphore_.Get(), "queue"};
    portSemaphore = {semaphore_.Get(), "port"};
    task = {task_.Get(), "the task"};
    port = {port_.Get(), "the port"};

    PluginLibrary& library = PluginLibrary::Shared();
    ASSERT_NE(library.Factory(), nullptr) << library.Error();
    void* plugin = library.Factory();
    module_ = CallSlot<void*, const char*>(plugin, 0, "IProtModule");
    protocols_ = CallSlot<void*, const char*>(plugin, 0, "IProtocolFactory");
  }

  static std::string Take() { return std::exchange(calls, std::string()); }

  Table factory_;
  Table multiTask_;
  Table task_;
  Table semaphore_;
  Table serial_;
  Table port_;
  Table storage_;
  Table storage2_;
  Table nothing_;
  void* module_ = nullptr;
  void* protocols_ = nullptr;
};

TEST_F(HostSlotsTest, AWholeLife) {
  ASSERT_EQ((CallSlot<int, void*>(module_, 5, &hostFactory)), 1);
  EXPECT_EQ(Take(),
            "create IMultiTask2\ncreate ISerialFactory\ncreate ISocketFactory\ncreate ICDSBuffer\n"
            "create IDiag\ncreate IPermanentStorage\ncreate IDriverInterface\ncreate ISmux\n"
            "create IFastTimer\n");
  void* protocol = CallSlot<void*, const char*>(protocols_, 5, "LOKA");
  ASSERT_NE(protocol, nullptr);
  EXPECT_EQ(Take(), "semaphore 0\nsemaphore 0\n");
  ASSERT_NE(
      (CallSlot<int, const char*>(protocol, 5,
                                  "CfgVer=1 model=1 port=com7 baudrate=9600 parity=odd bits=7 "
                                  "stopbits=2 mode=RS-485 gap=20")),
      0);
  ASSERT_NE(CallSlot<int>(protocol, 9), 0);
  EXPECT_EQ(Take(),
            "get integer LOKA baud\nconvert IPermanentStorage2\nget string LOKA rx_suffix\n"
            "get boolean LOKA hex_tokens\nopen com7\nsetup 4800 2 7 2 1\ntask 3\nstart task\n");

  ASSERT_NE(runner, nullptr);
  line = "A\x03";
  endsAfter = 1;
  CallSlot<void>(runner, 2);
  EXPECT_EQ(Take(),
            "to end?\nport lock\nreceive 20 0\nport unlock\nport lock\nreceive 20 0\nport unlock\n"
            "queue lock\nqueue unlock\nsleep 0\nto end?\n");

  const auto write = [&](const char* uri, const char* value) {
    void* tag = CallSlot<void*, const char*>(protocol, 6, uri);
    EXPECT_NE(tag, nullptr) << uri;
    const auto* bytes = reinterpret_cast<const unsigned char*>(value);
    return CallSlot<int, const void*, const unsigned char*>(protocol, 12, tag, bytes);
  };
  EXPECT_EQ(write("0?tx_token?string-3", "XYZ"), 1);
  EXPECT_EQ(Take(), "queue lock\nsend XYZ 0\nqueue unlock\n");
  EXPECT_EQ(write("0?SP_Par?unsignedByte", "\4"), 1);
  EXPECT_EQ(write("0?SP_TxPrefix?string-3", "02"), 1);
  EXPECT_EQ(write("0?SP_HexTokens?boolean", "\1"), 1);
  EXPECT_EQ(write("0?SP_Done?boolean", "\1"), 1);
  EXPECT_EQ(Take(),
            "queue lock\nset boolean LOKA hex_tokens true\nset integer LOKA parity 4\n"
            "set string LOKA tx_prefix 02\nsetup 4800 4 7 2 1\nqueue unlock\n");
  EXPECT_EQ(write("0?connect?boolean", "\0"), 1);
  EXPECT_EQ(Take(), "queue lock\nport lock\nrelease the port\nport unlock\nqueue unlock\n");

  ASSERT_NE(CallSlot<int>(protocol, 10), 0);
  EXPECT_EQ(Take(), "stop the task 1000\n");
  CallSlot<void, void*>(protocols_, 6, protocol);
  EXPECT_EQ(Take(), "delete queue\ndelete port\n");
  CallSlot<void>(module_, 6);
  EXPECT_EQ(Take(),
            "release IFastTimer\nrelease ISmux\nrelease IDriverInterface\nrelease IDiag\n"
            "release IPermanentStorage\nrelease IMultiTask2\nrelease ISerialFactory\n"
            "release ISocketFactory\nrelease ICDSBuffer\n");
}

TEST_F(HostSlotsTest, ExtendedStorage) {
  extendedStorage = true;
  ASSERT_EQ((CallSlot<int, void*>(module_, 5, &hostFactory)), 1);
  void* protocol = CallSlot<void*, const char*>(protocols_, 5, "LOKA");
  ASSERT_NE(
      (CallSlot<int, const char*>(protocol, 5,
                                  "CfgVer=1 model=1 port=com7 baudrate=9600 parity=odd bits=7 "
                                  "stopbits=2 mode=RS-485 autoConnect=false")),
      0);
  Take();
  ASSERT_NE(CallSlot<int>(protocol, 9), 0);
  EXPECT_EQ(Take(),
            "get integer LOKA baud\nconvert IPermanentStorage2\n"
            "get string into LOKA rx_suffix 256\nget boolean LOKA hex_tokens\ntask 3\n"
            "start task\n");
  CallSlot<int>(protocol, 10);
  CallSlot<void, void*>(protocols_, 6, protocol);
  CallSlot<void>(module_, 6);
  EXPECT_EQ(Take().find("WRONG"), std::string::npos);
}

// The tables notice a call of a slot that is not the agreed one.
TEST_F(HostSlotsTest, AWrongSlotIsNamed) {
  CallSlot<void>(&multiTask, 10);
  EXPECT_EQ(Take(), "WRONG IMultiTask2 slot 10\n");
  CallSlot<void>(&diag, 3);
  EXPECT_EQ(Take(), "WRONG IDiag slot 3\n");
}

}  // namespace
