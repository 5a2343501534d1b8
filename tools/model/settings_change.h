// Several changes of a settings file as one: it holds what it held, or all that was changed.
#ifndef MERO_TOOLS_SETTINGS_CHANGE_H
#define MERO_TOOLS_SETTINGS_CHANGE_H

#include <sys/types.h>

#include <string>
#include <string_view>

#include "base/failure.h"
#include "common/descriptor.h"

// Thrown when a file is changed, and may be the old one again after a power cut.
struct MayBeLost : Failure {
  using Failure::Failure;
};

// The platform's operations make the changes, in a copy beside the file. Until this ends it has the file's lock, as
// mero-wireless.conf(5) tells of it, so that nobody else's change is lost.
class SettingsChange {
 public:
  explicit SettingsChange(const std::string& path);
  SettingsChange(const SettingsChange&) = delete;
  SettingsChange& operator=(const SettingsChange&) = delete;
  ~SettingsChange();

  const char* copy() const { return copy_.c_str(); }

  // Sets one key of a section in the copy.
  void Set(const std::string& section, const char* szKey, const std::string& value) const;

  // Has the copy hold this alone, with this mode.
  void Write(std::string_view text, mode_t mode) const;

  // Puts the copy in the file's place. When that fails the file is as it was, unless MayBeLost says otherwise.
  void Commit();

 private:
  void Copy() const;

  std::string path_;  // where the file really is
  std::string copy_;
  std::string lockPath_;
  Descriptor lock_;
};

// Has a settings file hold this, with this mode. False when it does not, or may not outlast a power cut.
bool ReplaceSettings(const std::string& path, std::string_view text, mode_t mode);

// Removes a settings file, if there is one, and it is not back after a power cut. False when it is not sure to be gone.
bool RemoveSettings(const char* szPath);

#endif  // MERO_TOOLS_SETTINGS_CHANGE_H
