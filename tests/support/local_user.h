// Somebody else with an account on the machine.
#ifndef MERO_TESTS_LOCAL_USER_H
#define MERO_TESTS_LOCAL_USER_H

#include <functional>
#include <string>
#include <vector>

// Runs `act` as an unprivileged user, in a process of its own; whether it gave true.
bool RunAsLocalUser(const std::function<bool()>& act);

// Whether there can be one: in a user namespace of its own, a machine has no other users.
bool HasLocalUsers();

// What a local user may put in the way of a file, by a text that says what it is.
struct Obstacle {
  std::string name;
  std::function<bool(const std::string& path)> put;
};

// Each leads to, or is a second name of, `victim`, which is root's and holds "as was", where that is what it is.
std::vector<Obstacle> Obstacles(const std::string& victim);

#endif  // MERO_TESTS_LOCAL_USER_H
