// SPDX-License-Identifier: Apache-2.0
#include "factory/ProtModule.h"

#include "interfaces/CompareInterface.h"
#include "interfaces/ICDSBuffer.h"
#include "interfaces/IDiag.h"
#include "interfaces/IDriverInterface.h"
#include "interfaces/IFastTimer.h"
#include "interfaces/IInterfaceFactory.h"
#include "interfaces/IMultiTask2.h"
#include "interfaces/IPermanentStorage.h"
#include "interfaces/ISerialFactory.h"
#include "interfaces/ISmux.h"
#include "interfaces/ISocketFactory.h"
#include "protlib/HostInterfaces.h"
#include "protlib/NoThrow.h"

namespace {

// Asks the host for a service; null when it has none.
template <typename Service>
bool Obtain(IInterfaceFactory& hostFactory, const char* name, Service*& service) {
  service = static_cast<Service*>(hostFactory.CreateInterface(name));
  return service != nullptr;
}

template <typename Service>
void Release(IInterfaceFactory& hostFactory, Service*& service) {
  if (service != nullptr) {
    hostFactory.ReleaseInterface(service);
    service = nullptr;
  }
}

void ReleaseRequired(IInterfaceFactory& hostFactory) {
  Release(hostFactory, piMultiTask);
  Release(hostFactory, piSerialFactory);
  Release(hostFactory, piSocketFactory);
  Release(hostFactory, piCDSBuffer);
}

// The name of the first required service that is missing as its message has it, or null. The
// buffer's message names the pointer instead of the interface; hosts know it so.
const char* ObtainAll(IInterfaceFactory& hostFactory) {
  if (!Obtain(hostFactory, "IMultiTask2", piMultiTask)) {
    return "IMultiTask2 not created";
  }
  if (!Obtain(hostFactory, "ISerialFactory", piSerialFactory)) {
    return "ISerialFactory not created";
  }
  if (!Obtain(hostFactory, "ISocketFactory", piSocketFactory)) {
    return "ISocketFactory not created";
  }
  if (!Obtain(hostFactory, "ICDSBuffer", piCDSBuffer)) {
    return "piCDSBuffer not created";
  }
  return nullptr;
}

}  // namespace

ProtModule::~ProtModule() { Leave(); }

void* ProtModule::ConvertTo(const char* name) {
  return CompareInterface(name, "ProtModule") || CompareInterface(name, "IProtModule") ? this
                                                                                       : nullptr;
}

const char* ProtModule::GetImpName() const { return "ProtModule"; }

int ProtModule::GetImpVersion() const { return 100; }

int ProtModule::Init(IInterfaceFactory* hostFactory) {
  if (useCount_ != 0) {
    ++useCount_;
    return 1;
  }
  if (!ObtainRequired(hostFactory)) {
    return 0;
  }
  Obtain(*hostFactory, "IDiag", piDiag);
  Obtain(*hostFactory, "IPermanentStorage", piPermanentStorage);
  Obtain(*hostFactory, "IDriverInterface", piDriverInterface);
  Obtain(*hostFactory, "ISmux", piSmux);
  Obtain(*hostFactory, "IFastTimer", piFastTimer);
  hostFactory_ = hostFactory;
  useCount_ = 1;
  return 1;
}

// A host without a factory lacks every service, the first one first.
bool ProtModule::ObtainRequired(IInterfaceFactory* hostFactory) {
  const char* const problem =
      hostFactory == nullptr ? "IMultiTask2 not created" : ObtainAll(*hostFactory);
  if (problem == nullptr) {
    return true;
  }
  if (hostFactory != nullptr) {
    ReleaseRequired(*hostFactory);
  }
  NoThrow(false, [&] {
    lastError_ = problem;
    return true;
  });
  return false;
}

void ProtModule::Close() { Leave(); }

void ProtModule::Leave() {
  if (useCount_ == 1) {
    ReleaseServices();
  }
  if (useCount_ != 0) {
    --useCount_;
  }
}

void ProtModule::ReleaseServices() {
  Release(*hostFactory_, piFastTimer);
  Release(*hostFactory_, piSmux);
  Release(*hostFactory_, piDriverInterface);
  Release(*hostFactory_, piDiag);
  Release(*hostFactory_, piPermanentStorage);
  ReleaseRequired(*hostFactory_);
  hostFactory_ = nullptr;
}

const char* ProtModule::GetLastError() const { return lastError_.c_str(); }
