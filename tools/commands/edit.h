// edit: changes what was saved of a network.
#ifndef MERO_TOOLS_EDIT_H
#define MERO_TOOLS_EDIT_H

#include <optional>
#include <string>

#include "model/secrets.h"
#include "work/program.h"

// What is absent stays as it was saved.
struct NetworkToEdit {
  std::string name;  // or the address of its access point
  std::optional<std::string> ip;
  std::optional<std::string> mask;
  std::optional<std::string> gateway;
  std::optional<std::string> nameServers;
  std::optional<std::string> priority;
  std::optional<std::string> autojoin;
  SecretSource secret;
  bool askSecret = false;  // on the terminal

  bool concernsAddress() const { return ip || mask || gateway; }
  bool concernsSecret() const { return secret.isGiven() || askSecret; }
};

void Edit(const Program& program, const NetworkToEdit& wanted);

#endif  // MERO_TOOLS_EDIT_H
