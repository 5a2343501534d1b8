// Writes the files that the access-point daemon and the network start script read, after ending a daemon that runs.
#include <csignal>
#include <cstdio>
#include <cstring>

#include "common/hostapd_lines.h"
#include "common/log.h"
#include "common/paths.h"
#include "holders.h"
#include "platform.h"
#include "shell_words.h"
#include "wireless.h"

namespace {

// A configuration that is written line by line. A value with a line feed is refused, since it would add a line of its
// own, and names and secrets may come from anybody.
class Conf {
 public:
  Conf(const InterfacePath& path, NewFile::Readers readers) : path_(path), file_(path.c_str(), readers) {}

  explicit operator bool() const { return static_cast<bool>(file_); }

  void Text(const char* szKey, const char* szValue) { Line("%s=%s\n", szKey, szValue); }
  void Quoted(const char* szKey, const char* szValue) { Line("%s=\"%s\"\n", szKey, szValue); }
  void Number(const char* szKey, int value) { std::fprintf(file_.get(), "%s=%d\n", szKey, value); }
  void TwoTexts(const char* szKey, const char* szFirst, const char* szSecond) {
    std::fprintf(file_.get(), "%s=%s%s\n", szKey, szFirst, szSecond);
  }

  // Whether all lines were taken and have reached the file.
  [[nodiscard]] bool Close() {
    const bool written = file_.Close();
    if (!written || refused_) LOG("Failed to write file [%s]", path_.c_str());
    return written && !refused_;
  }

 private:
  void Line(const char* szFormat, const char* szKey, const char* szValue) {
    if (std::strchr(szValue, '\n') != nullptr) {
      LOG("The value of %s holds a line feed", szKey);
      refused_ = true;
      return;
    }
    std::fprintf(file_.get(), szFormat, szKey, szValue);
  }

  const InterfacePath& path_;
  NewFile file_;
  bool refused_ = false;
};

// ---- The guest network ----

bool WriteGuestInfo(const InterfacePath& path, bool enabled) {
  Conf info(path, NewFile::kForAll);
  if (!info) return LOG("Failed to open file [%s]", path.c_str()), false;
  info.Text("enable", enabled ? "yes" : "no");
  return info.Close();
}

BOOL SetGuestNetAPConf(const char* szIfName, PMERO_HOSTAP_GUEST_NET pConf) {
  if (szIfName == nullptr) return LOG("Bad parameter."), FALSE;
  const InterfacePath confPath(kHostapdGuestFormat, szIfName);
  const InterfacePath infoPath(kHostapdGuestInfoFormat, szIfName);
  if (!WriteGuestInfo(infoPath, pConf->blEnable != FALSE)) return FALSE;

  Conf file(confPath, NewFile::kSecret);
  if (!file) return LOG("Failed to open file [%s]", confPath.c_str()), FALSE;
  hostapd::WriteGuest(file, *pConf);
  return file.Close() ? TRUE : FALSE;
}

// ---- The steps ----

// Asks the first daemon in the list to end, and does not wait. kill() would take a pid below 1 for many processes.
void StopDaemon(const Pipe& processes) {
  int pid = 0;
  if (!processes || std::fscanf(processes.get(), " %d", &pid) != 1 || pid <= 0) return;
  if (::kill(pid, SIGTERM) < 0) LOG("Failed to kill hostapd");
}

void TakeDown(const char* szIfName) {
  if (PLIBNetIfDown(szIfName) == 0) LOG("Failed to deactivate network interface [%s].", szIfName);
}

bool MakeDirectory() {
  if (PLIBCExec("/bin/mkdir", "-p", kHostapdDirectory, nullptr, nullptr) == 0) return true;
  return LOG("Failed to mkdir %s", kHostapdDirectory), false;
}

// Only models with a built-in card have a guest network.
bool WriteGuestFiles(const char* szIfName, PMERO_HOSTAP_CONF pConf) {
  if (PLIBCFileCheckKeyValue(kModelPath, "support_pci_wifi", "yes", 0) == 0) return true;
  if (SetGuestNetAPConf(szIfName, &pConf->guestNet) != FALSE) return true;
  return LOG("Failed to set hostapd.conf for Guest Network"), false;
}

}  // namespace

BOOL MEROWirelessSetHostAPConf(const char* szIfName, PMERO_HOSTAP_CONF pConf) {
  if (szIfName == nullptr) return LOG("Bad parameter."), FALSE;
  const Pipe processes(Command<1024>("ps | grep hostapd | grep %s | awk {'print $1'}", ShellWord(szIfName).c_str()));
  StopDaemon(processes);
  TakeDown(szIfName);

  const InterfacePath path(kHostapdHostFormat, szIfName);
  (void)PLIBCSysUnlink(path.c_str());  // a failure does no harm: the file is written from its beginning
  if (!MakeDirectory()) return FALSE;
  Conf file(path, NewFile::kSecret);
  if (!file) return FALSE;
  hostapd::WriteMain(file, szIfName, *pConf);

  const bool guest = WriteGuestFiles(szIfName, pConf);
  return file.Close() && guest ? TRUE : FALSE;
}
