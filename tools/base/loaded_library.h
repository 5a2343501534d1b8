// Shared libraries that few commands need: to load one takes longer than most of what a command does.
#ifndef MERO_TOOLS_LOADED_LIBRARY_H
#define MERO_TOOLS_LOADED_LIBRARY_H

#include <stdexcept>

// The loader's reason for which a library, or a function of it, cannot be had.
struct NotLoaded : std::runtime_error {
  using std::runtime_error::runtime_error;
};

// A library that is loaded when this is made, and stays until the program ends.
class LoadedLibrary {
 public:
  // By its SONAME, so that its functions are those of the header that the program was built with. Throws NotLoaded.
  explicit LoadedLibrary(const char* szSoname);

  // A function of it, as its header declares it: library.Find<decltype(name)>("name"). Throws NotLoaded.
  template <class Function>
  Function* Find(const char* szName) const {
    return reinterpret_cast<Function*>(AddressOf(szName));
  }

 private:
  void* AddressOf(const char* szName) const;

  void* library_;
};

#endif  // MERO_TOOLS_LOADED_LIBRARY_H
