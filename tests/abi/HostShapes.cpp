// SPDX-License-Identifier: Apache-2.0
// One class for each interface that a host implements, so that the compiler lays out their tables.
// Nothing here is ever called.
#include "interfaces/ICDSBuffer.h"
#include "interfaces/IDiag.h"
#include "interfaces/IDriverInterface.h"
#include "interfaces/IFastTimer.h"
#include "interfaces/IInterfaceFactory.h"
#include "interfaces/IMultiTask2.h"
#include "interfaces/IPermanentStorage2.h"
#include "interfaces/ISemaphore.h"
#include "interfaces/ISerialFactory.h"
#include "interfaces/ISerialPort.h"
#include "interfaces/ISmux.h"
#include "interfaces/ISocketFactory.h"
#include "interfaces/ITask.h"

namespace host_shape {

template <class Interface>
class Root : public Interface {
 public:
  void* ConvertTo(const char* /*name*/) override { return nullptr; }
};

template <class Interface>
class Named : public Root<Interface> {
 public:
  const char* GetImpName() const override { return nullptr; }
  int GetImpVersion() const override { return 0; }
};

class InterfaceFactory final : public IInterfaceFactory {
 public:
  IInterface* CreateInterface(const char* /*name*/) override { return nullptr; }
  void ReleaseInterface(IInterface* /*interface*/) override {}
};

class Task : public Root<ITask> {
 public:
  int IsToEnd() override { return 0; }
  void reserved4() override {}
  int Start() override { return 0; }
};

class Semaphore : public Root<ISemaphore> {
 public:
  int Lock() override { return 0; }
  int Unlock() override { return 0; }
};

class MultiTask : public Named<IMultiTask2> {
 public:
  void reserved5() override {}
  int StopTask(ITask* /*task*/, int /*timeoutMs*/) override { return 0; }
  ISemaphore* CreateSemaphore(int /*reserved*/) override { return nullptr; }
  void DeleteSemaphore(ISemaphore* /*semaphore*/) override {}
  void Sleep(int /*milliseconds*/) override {}
  void reserved10() override {}
  void reserved11() override {}
  void reserved12() override {}
  ITask* CreateTask(ITaskRunner* /*runner*/, int /*taskClass*/) override { return nullptr; }
};

class SerialPort : public Root<ISerialPort> {
 public:
  void reserved3() override {}
  void reserved4() override {}
  int Setup(int /*baudrate*/, int /*parity*/, int /*dataBits*/, int /*stopBits*/,
            int /*mode*/) override {
    return 0;
  }
  int Send(const unsigned char* /*data*/, int /*lengthBytes*/, int /*timeoutMs*/) override {
    return 0;
  }
  int Receive(unsigned char* /*byte*/, int /*timeoutMs*/, int /*reserved*/) override { return 0; }
};

class SerialFactory : public Named<ISerialFactory> {
 public:
  ISerialPort* OpenPort(const char* /*name*/) override { return nullptr; }
  void ReleasePort(ISerialPort* /*port*/) override {}
};

class PermanentStorage : public Named<IPermanentStorage2> {
 public:
  void SetString(const char* /*ident*/, const char* /*key*/, const char* /*text*/) override {}
  void SetBoolean(const char* /*ident*/, const char* /*key*/, bool /*value*/) override {}
  void SetInteger(const char* /*ident*/, const char* /*key*/, int /*value*/) override {}
  const char* GetString(const char* /*ident*/, const char* /*key*/) override { return nullptr; }
  bool GetBoolean(const char* /*ident*/, const char* /*key*/) override { return false; }
  int GetInteger(const char* /*ident*/, const char* /*key*/) override { return 0; }
  int Exists(const char* /*ident*/, const char* /*key*/) override { return 0; }
  int GetStringInto(const char* /*ident*/, const char* /*key*/, char* /*buffer*/,
                    int /*sizeBytes*/) override {
    return 0;
  }
};

class SocketFactory : public Named<ISocketFactory> {};
class CdsBuffer : public Named<ICDSBuffer> {};
class Diag : public Named<IDiag> {};
class DriverInterface : public Named<IDriverInterface> {};
class Smux : public Named<ISmux> {};
class FastTimer : public Named<IFastTimer> {};

// A use of each class that outlives optimisation, so that the compiler writes its table.
template <class Shape>
void* Make() {
  return new Shape;
}
template void* Make<InterfaceFactory>();
template void* Make<Task>();
template void* Make<Semaphore>();
template void* Make<MultiTask>();
template void* Make<SerialPort>();
template void* Make<SerialFactory>();
template void* Make<PermanentStorage>();
template void* Make<SocketFactory>();
template void* Make<CdsBuffer>();
template void* Make<Diag>();
template void* Make<DriverInterface>();
template void* Make<Smux>();
template void* Make<FastTimer>();

}  // namespace host_shape
