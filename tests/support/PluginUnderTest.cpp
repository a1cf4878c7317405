// SPDX-License-Identifier: Apache-2.0
#include "tests/support/PluginUnderTest.h"

namespace {

// Asks for a named interface and for the same object by its interface, as a careful host does.
template <class Interface>
Interface* Ask(IInterfaceFactory* factory, const char* name) {
  IInterface* object = factory != nullptr ? factory->CreateInterface(name) : nullptr;
  return object != nullptr ? static_cast<Interface*>(object->ConvertTo(name)) : nullptr;
}

}  // namespace

PluginUnderTest::PluginUnderTest(PluginLibrary& library)
    : library_(library),
      module_(Ask<IProtModule>(library.Factory(), "IProtModule")),
      protocols_(Ask<IProtocolFactory>(library.Factory(), "IProtocolFactory")) {}

PluginUnderTest::~PluginUnderTest() {
  while (initCount_ > 0) Close();
}

int PluginUnderTest::Init(IInterfaceFactory* host) {
  const int result = module_->Init(host);
  if (result != 0) ++initCount_;
  return result;
}

void PluginUnderTest::Close() {
  if (initCount_ > 0) --initCount_;
  module_->Close();
}
