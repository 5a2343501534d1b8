// The connection that stands before another network is tried.
#ifndef MERO_TOOLS_FORMER_CONNECTION_H
#define MERO_TOOLS_FORMER_CONNECTION_H

#include <functional>
#include <optional>
#include <string>

#include "base/signals.h"
#include "model/library.h"
#include "model/status.h"
#include "work/program.h"
#include "work/routes.h"

class FormerConnection {
 public:
  // Notes what the connection of this moment is, if there is one.
  explicit FormerConnection(const Program& program);

  bool exists() const { return status_.isConnected(); }

  // Runs an attempt to join another network. When it fails or is interrupted, the former connection is brought back;
  // when there was none, nothing is left. Not so where another one has joined meanwhile, and when only a lease is
  // missing.
  void Try(const std::function<void()>& attempt) const;

  // Runs something else that may end the connection. When it fails or is interrupted, the connection is brought back,
  // unless it still stands, or the adapter is an access point. Where there was none, nothing is done.
  void Guard(const std::function<void()>& attempt) const;

 private:
  void Attempt(const std::function<void(const Signals&)>& attempt, const std::function<void()>& takeBack) const;
  bool Stands() const;
  void BringBackWhatHasEnded() const;
  void BringBack() const;
  bool Rejoin(const KnownNetwork& network) const;
  bool Readdress(const KnownNetwork& network) const;
  bool PutNameServersBack() const;
  void SayItIsBack(const KnownNetwork& network) const;

  const Program& program_;
  Status status_;
  std::optional<KnownNetwork> network_;  // with its address; nothing when it cannot be told what was joined
  Routes routes_;
  std::string nameServers_;  // that were saved for the network
};

// Ends all that a connection is made of; fails when something of it stays.
void LeaveNothing();

#endif  // MERO_TOOLS_FORMER_CONNECTION_H
