// The commands about the connection: connect, autoconnect, disconnect, status, watch, address, gateway, adhoc.
#ifndef MERO_TOOLS_CONNECTION_H
#define MERO_TOOLS_CONNECTION_H

#include <string>

#include "networks.h"
#include "program.h"
#include "secrets.h"

struct NetworkToJoin {
  std::string name;  // or the address of its access point
  SecretSource secret;
  std::string user;
  bool anyAccessPoint = false;
  bool address = true;
};

struct CellToMake {
  std::string name;
  bool wep = false;
  SecretSource secret;
};

void Connect(const Program& program, const NetworkToJoin& wanted);
void AutoConnect(const Program& program);
void Disconnect(const Program& program);
void ShowStatus(const Program& program);
void SetAddress(const Program& program, const Addressing& addressing);
void SetGateway(const Program& program, const std::string& gateway);
void MakeCell(const Program& program, const CellToMake& wanted);

// Shows the status now and whenever it has changed, `times` times or, with 0, until the program is ended.
void Watch(const Program& program, int times);

#endif  // MERO_TOOLS_CONNECTION_H
