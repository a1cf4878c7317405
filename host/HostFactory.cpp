// SPDX-License-Identifier: Apache-2.0
#include "host/HostFactory.h"

#include <array>

#include "host/PosixMultiTask.h"
#include "host/PosixSerialFactory.h"
#include "host/SqliteStorage.h"

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
