// The file of known networks as it really is.
#include "real_store.h"

#include <dlfcn.h>

#include <filesystem>
#include <functional>

#include "library_fakes.h"

namespace {

// The function that stands behind a fake.
template <class Result, class... Arguments>
void Uncover(std::function<Result(Arguments...)>& fake, const char* szName) {
  fake = reinterpret_cast<Result (*)(Arguments...)>(::dlsym(RTLD_NEXT, szName));
}

}  // namespace

void UseRealStore() {
  std::filesystem::create_directories("/usr/mero/etc");
  Uncover(library::MEROWirelessConfEnum, "MEROWirelessConfEnum");
  Uncover(library::MEROWirelessConfEnumByAtime, "MEROWirelessConfEnumByAtime");
  Uncover(library::MEROWirelessConfSet, "MEROWirelessConfSet");
  Uncover(library::PLIBCFileSetSectionValue, "PLIBCFileSetSectionValue");
  Uncover(library::PLIBCFileRemoveSection, "PLIBCFileRemoveSection");
}
