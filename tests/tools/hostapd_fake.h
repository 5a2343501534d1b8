// The access-point daemon, in the hands of a test: it answers on the control socket of wlan0.
#ifndef MERO_TESTS_TOOLS_HOSTAPD_FAKE_H
#define MERO_TESTS_TOOLS_HOSTAPD_FAKE_H

#include <sys/types.h>

#include <string>

class Hostapd {
 public:
  enum class Manner {
    kObeys,    // sends the last station away
    kIgnores,  // says so, and does not
    kRefuses,
  };

  explicit Hostapd(Manner manner = Manner::kObeys);
  Hostapd(const Hostapd&) = delete;
  Hostapd& operator=(const Hostapd&) = delete;
  ~Hostapd();

 private:
  pid_t pid_;
};

#endif  // MERO_TESTS_TOOLS_HOSTAPD_FAKE_H
