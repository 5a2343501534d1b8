// Secrets come from a file, the standard input or a prompt; never from the command line, which everybody can read.
#ifndef MERO_TOOLS_SECRETS_H
#define MERO_TOOLS_SECRETS_H

#include <optional>
#include <string>

#include "model/library.h"
#include "work/program.h"

struct SecretSource {
  std::string file;
  bool standardInput = false;

  bool isGiven() const { return !file.empty() || standardInput; }
};

// The secret from its source, or from the terminal by a prompt; nothing when there is neither. The line end behind a
// secret does not belong to it.
std::optional<std::string> ReadSecret(const SecretSource& source, const std::string& prompt);

// Who the user of a network is, if it asks for one: the given one, or else the answer to a prompt.
std::string UserOf(const Program& program, const KnownNetwork& config, const std::string& given);

// Puts a secret into a network that needs one; from a prompt when no source is given.
void SetSecret(const Program& program, KnownNetwork& config, const SecretSource& source);

// The failure of whoever gives a secret for a network that is not protected.
Failure TakesNoSecret(const std::string& name);

#endif  // MERO_TOOLS_SECRETS_H
