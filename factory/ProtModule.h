// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "interfaces/IProtModule.h"

// Obtains the host's services when its first user comes and releases them when its last user goes;
// see protlib/HostInterfaces.h for what they are. Loading thread.
class ProtModule : public IProtModule {
 public:
  ProtModule() = default;
  ProtModule(const ProtModule&) = delete;
  ProtModule& operator=(const ProtModule&) = delete;

  // Releases what the host never closed; runs when the library is unloaded.
  ~ProtModule() override;

  void* ConvertTo(const char* name) override;
  const char* GetImpName() const override;
  int GetImpVersion() const override;

  // Fails when one of the four required services is missing; those obtained are then released and
  // the services count as absent.
  int Init(IInterfaceFactory* hostFactory) override;
  void Close() override;
  const char* GetLastError() const override;

 private:
  bool ObtainRequired(IInterfaceFactory* hostFactory);
  void ReleaseServices();
  void Leave();

  std::string lastError_;
  IInterfaceFactory* hostFactory_ = nullptr;
  unsigned int useCount_ = 0;
};
