// The commands about the connection: connect, autoconnect, disconnect, status, adhoc.
#ifndef MERO_TOOLS_CONNECTION_H
#define MERO_TOOLS_CONNECTION_H

#include <string>

#include "model/join_lock.h"
#include "model/library.h"
#include "model/secrets.h"
#include "work/program.h"

struct NetworkToJoin {
  std::string name;  // or the address of its access point
  SecretSource secret;
  std::string user;
  bool anyAccessPoint = false;
  bool noAddress = false;
  bool isChanged = false;  // the protection on the air is accepted, whatever was saved
  bool noSave = false;
  std::string wait;  // so many seconds at most; empty for not at all
};

struct CellToMake {
  std::string name;
  bool wep = false;
  SecretSource secret;
};

void Connect(const Program& program, const NetworkToJoin& wanted);

// Joins a known network, with its address, and says nothing.
void JoinAgain(const Program& program, const std::string& name);

void AutoConnect(const Program& program, JoinLockFor who = JoinLockFor::kCommand);

// Asks for an address anew where the DHCP client of the connection was killed, for `autoconnect --keep`.
void LeaseAgain(const Program& program);

void Disconnect(const Program& program);
void ShowStatus(const Program& program);
void MakeCell(const Program& program, const CellToMake& wanted);

#endif  // MERO_TOOLS_CONNECTION_H
