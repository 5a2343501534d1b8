// Somebody else with an account on the machine.
#ifndef MERO_TESTS_LOCAL_USER_H
#define MERO_TESTS_LOCAL_USER_H

#include <functional>
#include <string>

// Runs `act` as an unprivileged user, in a process of its own; whether it gave true.
bool RunAsLocalUser(const std::function<bool()>& act);

// Whether there can be one: in a user namespace of its own, a machine has no other users.
bool HasLocalUsers();

// Has a local user put everything that may be in the way of a file into its place, one thing after another: `clear`
// makes room for each, and `look` sees to what comes of it. Some of them lead to `victim`, which is root's, holds
// "as was", and must hold that afterwards too.
void ObstructEachWay(const std::string& path, const std::string& victim, const std::function<void()>& clear,
                     const std::function<void()>& look);

// Whether there is a file of our own, under no second name.
bool IsOurs(const std::string& path);

#endif  // MERO_TESTS_LOCAL_USER_H
