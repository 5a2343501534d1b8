// The commands about networks: scan, known, save, forget.
#ifndef MERO_TOOLS_NETWORKS_H
#define MERO_TOOLS_NETWORKS_H

#include <string>
#include <vector>

#include "model/addressing.h"
#include "model/library.h"
#include "model/saved_networks.h"
#include "model/secrets.h"
#include "wireless.h"
#include "work/program.h"

struct NetworkToSave {
  std::string name;  // or the address of its access point
  std::string address;
  std::string security;  // how it is protected; given together with `address`, for a network that no scan shows
  SecretSource secret;
  Addressing addressing;
};

// The results that a list of what is in range is made of. Those that are used are at most half a minute old.
enum class Results { kUsable, kThoseThereAre, kNew };

// The networks in range. Fails when they would have to be scanned for, and that would disturb an access point.
std::vector<Network> NetworksInRange(const Program& program, Results results);

void Scan(const Program& program, Results results);
void ListKnown(const Program& program, bool byTime, bool showSecrets);
void Save(const Program& program, const NetworkToSave& wanted);

// Forgets every known network of a name, or the one of an access point's address.
void Forget(const Program& program, const std::string& name);

// Tells what was done to known networks.
void SayChanged(const Program& program, const std::string& sentence, const std::vector<SavedNetwork>& networks);

#endif  // MERO_TOOLS_NETWORKS_H
