// The network-script file of an interface or a bridge, which the network start script reads.
#ifndef MERO_PLATFORM_NETWORK_SCRIPT_H
#define MERO_PLATFORM_NETWORK_SCRIPT_H

#include <cstddef>

#include "common/paths.h"

// Changes are made key by key; the first that fails is reported, and no other is made after it.
class NetworkScript {
 public:
  explicit NetworkScript(const char* szIfName) : path_(kInterfaceScriptFormat, szIfName) {}

  bool exists() const;

  // Reads a value; an empty text when there is none.
  template <size_t kSize>
  void Get(const char* szKey, char (&szValue)[kSize]) const {
    Get(szKey, szValue, kSize);
  }

  void Set(const char* szKey, const char* szValue);
  void Remove(const char* szKey);

  // Whether all changes were made.
  bool written() const { return written_; }

 private:
  void Get(const char* szKey, char* szValue, size_t cbValue) const;

  InterfacePath path_;
  bool written_ = true;
};

#endif  // MERO_PLATFORM_NETWORK_SCRIPT_H
