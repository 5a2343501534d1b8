// Shared libraries that few commands need.
#include "base/loaded_library.h"

#include <dlfcn.h>

namespace {

void* Loaded(void* address) {
  if (address == nullptr) throw NotLoaded(::dlerror());
  return address;
}

}  // namespace

LoadedLibrary::LoadedLibrary(const char* szSoname) : library_(Loaded(::dlopen(szSoname, RTLD_NOW))) {}

void* LoadedLibrary::AddressOf(const char* szName) const {
  return Loaded(::dlsym(library_, szName));
}
