// The access point that is on the air before another one is tried in its place.
#ifndef MERO_TOOLS_AP_FORMER_H
#define MERO_TOOLS_AP_FORMER_H

#include <sys/types.h>

#include <optional>
#include <string>
#include <vector>

// Holds the files that it was started from, which the next one overwrites.
class FormerAp {
 public:
  // `nextBridge` is that of the next one. Fails when one of the files is there and cannot be read.
  FormerAp(std::string interface, const std::string& nextBridge);

  // Puts its files back and starts it again. False when that fails.
  bool PutBack() const;

 private:
  struct File {
    std::string path;
    std::optional<std::string> text;  // nothing where there was no such file
    mode_t mode;
  };

  void Keep(const std::string& path);

  std::string interface_;
  std::string bridge_;
  std::vector<File> files_;
};

#endif  // MERO_TOOLS_AP_FORMER_H
