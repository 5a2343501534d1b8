// The name servers that an interface has brought to the resolver.
#ifndef MERO_TOOLS_NAME_SERVERS_H
#define MERO_TOOLS_NAME_SERVERS_H

#include <string>
#include <vector>

// Those in the resolver's settings, of a lease or saved ones; not the ones that are there from elsewhere.
std::vector<std::string> NameServersOf(const std::string& interface);

// Those of them that were saved for the network, with blanks between them.
std::string SavedNameServersOf(const std::string& interface);

// Makes these the interface's until it leaves the network, in place of a lease's; none when the text is empty. Fails
// when the kit's script fails.
void SetNameServers(const std::string& interface, const std::string& servers);

// Checks name servers that are written with commas or blanks between them; gives them with one blank.
std::string CheckedNameServers(const std::string& text);

#endif  // MERO_TOOLS_NAME_SERVERS_H
