// SPDX-License-Identifier: Apache-2.0
// The least that a host must be. Prints COUNT tokens, then hands each line to the driver's console.
#include <dlfcn.h>
#include <fcntl.h>
#include <poll.h>
#include <termios.h>
#include <unistd.h>

#include <atomic>
#include <iostream>
#include <map>
#include <string>
#include <thread>

#include "interfaces/ICDSBuffer.h"
#include "interfaces/IInterfaceFactory.h"
#include "interfaces/IMultiTask2.h"
#include "interfaces/IProtModule.h"
#include "interfaces/IProtocol7.h"
#include "interfaces/IProtocolFactory.h"
#include "interfaces/ISemaphore.h"
#include "interfaces/ISerialFactory.h"
#include "interfaces/ISerialPort.h"
#include "interfaces/ISocketFactory.h"
#include "interfaces/ITask.h"
#include "interfaces/ITaskRunner.h"

template <class Interface>
struct Object : Interface {  // the head of an object that offers nothing besides itself
  void* ConvertTo(const char* /*name*/) override { return nullptr; }
};
template <class Interface>
struct Service : Object<Interface> {
  const char* GetImpName() const override { return "MinimalHost"; }
  int GetImpVersion() const override { return 100; }
};
struct Semaphore : Object<ISemaphore> {  // first come, first served, as it must be
  int Lock() override {
    for (const unsigned int mine = last++; mine != now;) poll(nullptr, 0, 1);
    return 1;
  }
  int Unlock() override { return ++now, 1; }
  std::atomic<unsigned int> last{0}, now{0};
};
struct Task : Object<ITask> {
  explicit Task(ITaskRunner* itsRunner) : runner(itsRunner) {}
  ~Task() override { thread.join(); }
  int IsToEnd() override { return isToEnd ? 1 : 0; }
  void reserved4() override {}
  int Start() override { return thread = std::thread(&ITaskRunner::Task, runner), 1; }
  ITaskRunner* runner;
  std::atomic<bool> isToEnd{false};
  std::thread thread;
};
struct MultiTask : Service<IMultiTask2> {
  int StopTask(ITask* task, int /*timeoutMs*/) override {
    static_cast<Task*>(task)->isToEnd = true;
    return delete task, 1;  // waits; a real host gives up after timeoutMs and answers 0
  }
  ISemaphore* CreateSemaphore(int /*reserved*/) override { return new Semaphore; }
  void DeleteSemaphore(ISemaphore* semaphore) override { delete semaphore; }
  void Sleep(int milliseconds) override { (void)poll(nullptr, 0, milliseconds); }
  ITask* CreateTask(ITaskRunner* runner, int /*taskClass*/) override { return new Task(runner); }
  void reserved5() override {}
  void reserved10() override {}
  void reserved11() override {}
  void reserved12() override {}
};
struct SerialPort : Object<ISerialPort> {
  int Setup(int baudrate, int parity, int dataBits, int stopBits, int /*mode*/) override {
    termios line = {};
    if (tcgetattr(file, &line) != 0 || cfsetspeed(&line, speed_t(baudrate)) != 0) return 0;
    cfmakeraw(&line);
    static const tcflag_t kParities[] = {0, PARENB, PARENB | PARODD, PARENB | PARODD | CMSPAR,
                                         PARENB | CMSPAR};
    line.c_cflag &= ~static_cast<tcflag_t>(CSIZE | PARENB | PARODD | CMSPAR | CSTOPB);
    line.c_cflag |=
        (dataBits == 7 ? CS7 : CS8) | (stopBits == 2 ? CSTOPB : 0U) | kParities[parity] | CLOCAL;
    return tcsetattr(file, TCSANOW, &line) == 0 ? 1 : 0;
  }
  int Send(const unsigned char* data, int lengthBytes, int /*timeoutMs*/) override {
    return write(file, data, static_cast<std::size_t>(lengthBytes)) == lengthBytes ? 1 : 0;
  }
  int Receive(unsigned char* byte, int timeoutMs, int /*reserved*/) override {
    pollfd wait = {file, POLLIN, 0};
    return poll(&wait, 1, timeoutMs) == 1 && read(file, byte, 1) == 1 ? 1 : 0;
  }
  void reserved3() override {}
  void reserved4() override {}
  int file = -1;
};
struct SerialFactory : Service<ISerialFactory> {
  ISerialPort* OpenPort(const char* /*name*/) override {
    port.file = open(device.c_str(), O_RDWR | O_NOCTTY | O_NONBLOCK | O_CLOEXEC);
    return port.file >= 0 ? &port : nullptr;
  }
  void ReleasePort(ISerialPort* /*port*/) override { close(port.file); }
  std::string device;
  SerialPort port;
};
struct HostFactory final : IInterfaceFactory {
  IInterface* CreateInterface(const char* name) override { return services[name]; }
  void ReleaseInterface(IInterface* /*interface*/) override {}
  MultiTask multiTask;
  SerialFactory serialFactory;
  Service<ISocketFactory> socketFactory;
  Service<ICDSBuffer> buffer;
  std::map<std::string, IInterface*> services = {{"IMultiTask2", &multiTask},
                                                 {"ISerialFactory", &serialFactory},
                                                 {"ISocketFactory", &socketFactory},
                                                 {"ICDSBuffer", &buffer}};
};

int main(int argc, char** argv) {
  if (argc != 5) return std::cerr << "usage: minimal_host LIBRARY DEVICE COUNT CONFIG\n", 2;
  void* const library = dlopen(argv[1], RTLD_NOW);
  if (library == nullptr) return std::cerr << dlerror() << '\n', 3;
  auto* const factory =
      reinterpret_cast<GetInterfaceFactoryFunction>(dlsym(library, kGetInterfaceFactoryName))();
  auto* const module = static_cast<IProtModule*>(factory->CreateInterface("IProtModule"));
  auto* const maker = static_cast<IProtocolFactory*>(factory->CreateInterface("IProtocolFactory"));
  HostFactory host;
  host.serialFactory.device = argv[2];
  if (module->Init(&host) == 0) return std::cerr << module->GetLastError() << '\n', 3;
  IProtocol* const protocol = maker->CreateProtocol("LOKA");
  const bool isStarted = protocol->Config(argv[4]) != 0 && protocol->Start() != 0;
  std::cout << (isStarted ? "started" : protocol->GetLastErrorString()) << std::endl;
  ITag* const available = protocol->CreateTag("0?tokens_available?unsignedInt");
  ITag* const token = protocol->CreateTag("0?rx_token?string-1000");
  ITag* const acknowledge = protocol->CreateTag("0?token_ack?boolean");
  for (int left = isStarted ? std::stoi(argv[3]) : 0; left > 0; --left) {
    unsigned int count = 0;
    unsigned char text[1000] = {};
    while (protocol->Read(available, reinterpret_cast<unsigned char*>(&count)) == 0 || count == 0)
      host.multiTask.Sleep(10);
    (void)protocol->Read(token, text);
    std::cout << reinterpret_cast<const char*>(text) << std::endl;
    (void)protocol->Write(acknowledge, reinterpret_cast<const unsigned char*>("\1"));
  }
  for (std::string line; isStarted && std::getline(std::cin, line);) {
    char reply[4096] = {};
    const bool isDone = protocol->DoCommand(line.c_str(), reply, sizeof(reply) - 1);
    std::cout << reply << '\n' << (isDone ? "true" : "false") << std::endl;
  }
  protocol->Stop();
  maker->DeleteProtocol(protocol);  // with its tags
  module->Close();
  return dlclose(library) == 0 && isStarted ? 0 : 4;
}
