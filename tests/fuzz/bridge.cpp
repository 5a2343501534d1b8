// The network-script file of a bridge: one that is written reads back the same, field by field, and keys of others
// stay; what a shell would not read back is refused, and nothing is written.
//
// Runs: 4000
// Covers: platform/sdk/bridge_settings.cpp platform/sdk/network_script.cpp
#include <algorithm>
#include <cstring>
#include <vector>

#include "common/paths.h"
#include "platform.h"
#include "tests/fuzz/support.h"

namespace {

constexpr char kBridge[] = "lbr0";
const InterfacePath kScript(kInterfaceScriptFormat, kBridge);

struct Bridge {
  NETINFO net{};
  BRIDGE_INFO info{};
};

// A bridge's fields as text; all of them end.
std::string Described(const Bridge& bridge) {
  const auto& [net, info] = bridge;
  const std::string name = EndedText(net.szInterface).empty() ? EndedText(info.szIfName) : EndedText(net.szInterface);
  std::string text = name + "\n" + EndedText(net.szIp) + "\n" + EndedText(net.szMask) + "\n" +
                     EndedText(info.info.szPrimary) + "\n" + std::to_string(info.type) + "\n" +
                     (net.blManual != FALSE ? "static\n" : "dhcp\n") + (net.blActive != FALSE ? "yes\n" : "no\n");
  for (const unsigned char octet : net.rgbMac) text += std::to_string(octet) + " ";
  return text;
}

std::optional<Bridge> Read() {
  Bridge bridge;
  if (MERONetGetBridgeConfig(kBridge, &bridge.net, &bridge.info) < 0) return std::nullopt;
  return bridge;
}

Bridge Taken(Fields& fields) {
  Bridge bridge;
  fields.Fill(bridge.net.szInterface);
  fields.Fill(bridge.info.szIfName);
  bridge.info.type = static_cast<BR_TYPE>(fields.Number());
  fields.Fill(bridge.info.info.szPrimary);
  bridge.net.blManual = fields.Flag() ? TRUE : FALSE;
  bridge.net.blActive = fields.Flag() ? TRUE : FALSE;
  fields.Fill(bridge.net.szIp);
  fields.Fill(bridge.net.szMask);
  char szMac[sizeof bridge.net.rgbMac] = {};
  fields.Fill(szMac);
  std::ranges::copy(szMac, bridge.net.rgbMac);
  return bridge;
}

// The lines of a script that are about nothing that a bridge's record has.
std::vector<std::string> LinesOfOthers(const std::string& text) {
  constexpr const char* kKeys[] = {"TYPE",    "NAT",    "PRIMARY", "BOOTPROTO", "IPADDR",
                                   "NETMASK", "ONBOOT", "HWADDR",  "DEVICE"};
  std::vector<std::string> lines = LinesOf(text);
  std::erase_if(lines, [&](const std::string& line) {
    const std::size_t equals = line.find('=');
    return equals != line.npos && std::ranges::find(kKeys, Trimmed(line.substr(0, equals))) != std::end(kKeys);
  });
  return lines;
}

void CheckWriting(const Bridge& bridge) {
  const std::string before = FileAt(kScript.c_str()).value_or("");
  if (MERONetSetBridgeConfig(&bridge.net, &bridge.info) < 0) {
    return Require(FileAt(kScript.c_str()) == before, "what is refused leaves the file as it is", {before});
  }
  const std::string wanted = Described(bridge);
  const std::string name = wanted.substr(0, wanted.find('\n'));
  Bridge written;
  Require(MERONetGetBridgeConfig(name.c_str(), &written.net, &written.info) == 0 && Described(written) == wanted,
          "a bridge that is written reads back the same", {wanted, Described(written)});
  if (name != kBridge) return RemoveFile(InterfacePath(kInterfaceScriptFormat, name.c_str()).c_str());
  const std::string after = FileAt(kScript.c_str()).value_or("");
  Require(LinesOfOthers(after) == LinesOfOthers(before), "keys of others stay", {before, after});
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Fields fields(data, size);
  const Bridge bridge = Taken(fields);
  const std::string text = fields.Rest();
  PutFile(kScript.c_str(), text);
  if (const std::optional<Bridge> read = Read()) {
    Described(*read);
    CheckWriting(*read);
  }
  CheckWriting(bridge);
  return 0;
}
