// SPDX-License-Identifier: Apache-2.0
#include "host/runtime/HostFactory.h"

#include <array>

#include "host/port/PosixSerialFactory.h"
#include "host/runtime/PosixMultiTask.h"
#include "host/store/SqliteStorage.h"

HostFactory::HostFactory(PosixMultiTask* multiTask, PosixSerialFactory* serialFactory,
                         SqliteStorage* storage)
    : multiTask_(multiTask), serialFactory_(serialFactory), storage_(storage) {}

IInterface* HostFactory::CreateInterface(const char* name) {
  struct Service {
    const char* name;
    IInterface* object;
  };
  const std::array<Service, 5> services = {{{"IMultiTask2", multiTask_},
                                            {"ISerialFactory", serialFactory_},
                                            {"ISocketFactory", &socketFactory_},
                                            {"ICDSBuffer", &cdsBuffer_},
                                            {"IPermanentStorage", storage_}}};
  for (const Service& service : services) {
    if (service.object != nullptr && CompareInterface(name, service.name)) {
      ++lentCount_;
      return service.object;
    }
  }
  return nullptr;
}

void HostFactory::ReleaseInterface(IInterface* interface) {
  if (interface != nullptr) {
    --lentCount_;
  }
}
