// A DHCP server's files: a record that is read can be given back, and changes nothing but the switch; one that is
// written reads back the same, field by field; what the files cannot hold is refused, and nothing is written.
//
// Runs: 2500
// MaxLen: 16384
// Covers: platform/sdk/dhcp_server.cpp platform/base/number.cpp platform/base/directory.cpp
#include <cstring>
#include <memory>

#include "common/paths.h"
#include "platform.h"
#include "tests/fuzz/support.h"

namespace {

using Conf = MERO_DHCPD_CONF;

constexpr char kBridge[] = "lbr0";
const InterfacePath kConf(kDhcpConfFormat, kBridge, kBridge);
const InterfacePath kInfo(kDhcpInfoFormat, kBridge, kBridge);

// A record's fields as text; all of them end.
std::string Described(const Conf& conf) {
  std::string text;
  for (const std::string& field :
       {EndedText(conf.szRangeStart), EndedText(conf.szRangeEnd), EndedText(conf.szInterface), EndedText(conf.szDomain),
        EndedText(conf.szDns), EndedText(conf.szSDns), EndedText(conf.szSubnet), EndedText(conf.szRouter),
        EndedText(conf.szLeaseFile), EndedText(conf.szTag), std::to_string(conf.autoTime),
        std::to_string(conf.leaseTime)}) {
    text += field + "\n";
  }
  return text;
}

std::unique_ptr<Conf> Read() {
  auto conf = std::make_unique<Conf>();
  return MERONetGetDhcpServerConf(kBridge, kBridge, conf.get()) > 0 ? std::move(conf) : nullptr;
}

void Fill(Fields& fields, Conf& conf) {
  conf.autoTime = fields.Number();
  conf.leaseTime = fields.Number();
  fields.Fill(conf.szInterface);
  fields.Fill(conf.szTag);
  fields.Fill(conf.szRangeStart);
  fields.Fill(conf.szRangeEnd);
  fields.Fill(conf.szSubnet);
  fields.Fill(conf.szRouter);
  fields.Fill(conf.szDns);
  fields.Fill(conf.szSDns);
  fields.Fill(conf.szDomain);
  fields.Fill(conf.szLeaseFile);
}

void CheckGivingBack(int enable, const std::string& text) {
  const auto read = Read();
  Require(read != nullptr, "a configuration that is there is read", {text});
  Require(MERONetSetDhcpServerConfigFiles(read.get(), enable) > 0, "a record that was read can be given back", {text});
  Require(FileAt(kConf.c_str()) == text, "what is given back changes nothing", {text});
  const auto again = Read();
  Require(again && Described(*again) == Described(*read) && again->blEnable == (enable != 0 ? TRUE : FALSE),
          "only the switch is set", {text});
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Fields fields(data, size);
  const int enable = fields.Number();
  const auto conf = std::make_unique<Conf>();
  Fill(fields, *conf);
  const std::string info = fields.Text();
  const std::string text = fields.Rest();
  PutFile(kConf.c_str(), text);
  PutFile(kInfo.c_str(), info);
  CheckGivingBack(enable, text);

  const std::string switched = FileAt(kInfo.c_str()).value_or("");
  const std::string_view name = {conf->szInterface, ::strnlen(conf->szInterface, sizeof conf->szInterface)};
  const std::string_view tag = {conf->szTag, ::strnlen(conf->szTag, sizeof conf->szTag)};
  const bool isOurs = name == kBridge && tag == kBridge;
  if (MERONetSetDhcpServerConfigFiles(conf.get(), enable) > 0) {
    const std::string wanted = Described(*conf);
    const auto written = std::make_unique<Conf>();
    Require(MERONetGetDhcpServerConf(conf->szInterface, conf->szTag, written.get()) > 0 &&
                Described(*written) == wanted && written->blEnable == (enable != 0 ? TRUE : FALSE),
            "a record that is written reads back the same", {wanted, Described(*written)});
    RemoveFile(InterfacePath(kDhcpConfFormat, conf->szInterface, conf->szTag).c_str());
    RemoveFile(InterfacePath(kDhcpInfoFormat, conf->szInterface, conf->szTag).c_str());
    Require(isOurs || FileAt(kConf.c_str()) == text, "another server's files stay", {text});
  } else {
    Require(FileAt(kConf.c_str()) == text && FileAt(kInfo.c_str()) == switched,
            "what is refused leaves the files as they are", {text});
  }
  return 0;
}
