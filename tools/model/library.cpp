// The library in this program's own words.
#include "model/library.h"

#include <search.h>

#include <cstddef>
#include <cstdlib>
#include <cstring>

#include "model/ap_state.h"
#include "model/kernel_switch.h"
#include "model/library_lines.h"
#include "work/radio.h"

namespace {

// The head of a ring, and the end of its records.
template <class Record>
class Ring {
 public:
  Ring() : head_{&head_, &head_} {}
  Ring(const Ring&) = delete;
  Ring& operator=(const Ring&) = delete;
  ~Ring() {
    while (head_.q_forw != &head_) {
      WIRELESS_LIST* node = head_.q_forw;
      ::remque(node);
      std::free(RecordOf(node));
    }
  }

  WIRELESS_LIST* head() { return &head_; }

  std::vector<Record> Records() {
    std::vector<Record> records;
    for (WIRELESS_LIST* node = head_.q_forw; node != &head_; node = node->q_forw) records.push_back(*RecordOf(node));
    return records;
  }

 private:
  static Record* RecordOf(WIRELESS_LIST* node) {
    return reinterpret_cast<Record*>(reinterpret_cast<char*>(node) - offsetof(Record, list));
  }

  WIRELESS_LIST head_;
};

// A result and the records behind it, as bytes, and back.
template <class Record>
std::string Pack(int result, const std::vector<Record>& records) {
  std::string bytes(reinterpret_cast<const char*>(&result), sizeof result);
  return bytes.append(reinterpret_cast<const char*>(records.data()), records.size() * sizeof(Record));
}

template <class Record>
int Unpack(const std::string& bytes, std::vector<Record>& records) {
  int result = 0;
  std::memcpy(&result, bytes.data(), sizeof result);
  records.resize((bytes.size() - sizeof result) / sizeof(Record));
  if (!records.empty()) std::memcpy(records.data(), bytes.data() + sizeof result, records.size() * sizeof(Record));
  return result;
}

Failure ScanFailed() {
  if (MEROWirelessAdapterNum() <= 0) return NoAdapter();
  if (WasReported(Report::kInterfaceStaysDown)) {
    return Failed("the adapter's interface cannot be brought up", "plug the adapter out and in, and try again");
  }
  return Failed("the adapter gave no scan results", "try again with --renew; -v shows what the library reports");
}

bool IsNamed(const Network& network, const std::string& name, const std::optional<Address>& address) {
  return name == network.szEssid || (address && std::ranges::equal(*address, network.bssid));
}

// How a search ended: 1 found, 0 not, below 0 failed.
struct Answer {
  int result;
  Network network;
};

// Searches the results of the adapter's last scan; when there are none, the library scans. Six bytes of an address it
// takes as a pointer to text.
Answer LookUpBy(const char* szValue, WIRELESS_FILTER filter) {
  Answer found{};
  found.result = MEROWirelessNetworkGet(szValue, filter, &found.network);
  return found;
}

Answer LookUp(const Address& address) {
  return LookUpBy(reinterpret_cast<const char*>(address.data()), WIRELESS_FILTER_BSSID);
}

Answer LookUp(const std::string& name, const std::optional<Address>& address) {
  const Answer found = LookUpBy(name.c_str(), WIRELESS_FILTER_ESSID);
  return found.result == 0 && address ? LookUp(*address) : found;
}

// The last results may be older than the network.
bool ScanAfresh() {
  Ring<Network> ring;
  return MEROWirelessNetworkScan(WIRELESS_SCAN_RENEW, ring.head()) >= 0;
}

Answer LookUpAfresh(const std::string& name, const std::optional<Address>& address) {
  return ScanAfresh() ? LookUp(name, address) : Answer{-1, {}};
}

// The access point that a network is to be joined through; nothing when any will do.
std::optional<Address> AccessPointFor(const KnownNetwork& config) {
  Address address;
  std::ranges::copy(config.network.bssid, address.begin());
  return config.noneBssid != 0 || address == Address{} ? std::nullopt : std::optional(address);
}

}  // namespace

std::vector<Network> InRange(const Program& program, WIRELESS_SCAN scan) {
  const std::string bytes = RunBytes(program.Doing("scanning"), [scan] {
    Ring<Network> ring;
    const int result = MEROWirelessNetworkScan(scan, ring.head());
    return Pack(result, ring.Records());
  });
  std::vector<Network> networks;
  if (Unpack(bytes, networks) < 0) throw ScanFailed();
  return networks;
}

std::vector<KnownNetwork> Known(Order order) {
  Ring<KnownNetwork> ring;
  const auto list = order == Order::kByTime ? MEROWirelessConfEnumByAtime : MEROWirelessConfEnum;
  if (list(ring.head()) < 0) {
    throw Failed("the known networks cannot be read", "-v shows what the library reports");
  }
  return ring.Records();
}

Network FindInRange(const Program& program, const std::string& name) {
  RequireScanning();
  const std::optional<Address> address = ParseAddress(name);
  const std::string shown = program.output.Name(name);
  const auto answer = Run<Answer>(program.Doing("looking for " + shown), [&] {
    const Answer found = LookUp(name, address);
    return found.result != 0 ? found : LookUpAfresh(name, address);
  });
  if (answer.result < 0) throw ScanFailed();
  if (answer.result == 0) {
    throw Failure(Exit::kOutOfRange, "no network named " + shown + " is in range",
                  "`merowireless scan --renew` shows those that are");
  }
  return answer.network;
}

bool IsInRange(const Program& program, const KnownNetwork& config) {
  const std::string name = config.network.szEssid;
  const std::optional<Address> address = AccessPointFor(config);
  const auto isListed = [&] { return (address ? LookUp(*address) : LookUp(name, std::nullopt)).result > 0; };
  return Run<bool>(program.Doing("looking for " + program.output.Name(name)), [&] {
    return isListed() || ((CallNetwork(MEROWirelessInterfaceGet(), name) || ScanAfresh()) && isListed());
  });
}

std::vector<KnownNetwork> AllKnown(const std::string& name) {
  std::vector<KnownNetwork> known = Known(Order::kByTime);
  const std::optional<Address> address = ParseAddress(name);
  std::erase_if(known, [&](const KnownNetwork& other) { return !IsNamed(other.network, name, address); });
  return known;
}

std::optional<KnownNetwork> FindKnown(const std::string& name) {
  const std::vector<KnownNetwork> known = AllKnown(name);
  return known.empty() ? std::nullopt : std::optional(known.front());
}

void RequireAdapter() {
  if (MEROWirelessAdapterNum() <= 0) throw NoAdapter();
}

void RequireScanning() {
  if (!IsAccessPoints()) return;
  throw Failure(Exit::kBusy, "the adapter is an access point's, and a scan would disturb it",
                "`merowireless ap disable` takes it down; `merowireless scan --cached` shows what was heard last");
}

void RequireNoBlock() {
  const KernelBlock block = KernelBlockOf(MEROWirelessInterfaceGet());
  if (block == KernelBlock::kSet) {
    throw Failure(Exit::kRadioOff, "the kernel blocks the radio", "`merowireless radio on` lifts the block");
  }
  if (block == KernelBlock::kOfHardware) {
    throw Failure(Exit::kRadioOff, "a switch of the hardware has the radio blocked", "look for it at the adapter");
  }
}

void RequireRadio() {
  const int answer = MEROWirelessCheckBlock();
  if (answer != 1) {
    throw Failure(Exit::kRadioOff,
                  answer == 0 ? "the radio is switched off" : "nobody knows whether the radio may be used",
                  "`merowireless radio on` switches it on");
  }
  RequireNoBlock();
}

void RefuseWhileRadioIsOff() {
  if (MEROWirelessCheckBlock() == 0) RequireRadio();
  RequireNoBlock();
}

std::string AdapterModelOrNone() {
  char szModel[1024];
  return MEROWirelessApConfigSecNameGet(szModel, sizeof szModel) == TRUE ? szModel : "";
}

std::string AdapterModel() {
  std::string model = AdapterModelOrNone();
  if (!model.empty()) return model;
  if (MEROWirelessAdapterNum() <= 0) throw NoAdapter();
  throw Failed("the adapter has not been announced",
               "plug the adapter out and in, so that /tmp/wireless.info is written");
}

Failure NoAdapter() {
  return {Exit::kNoAdapter, "no adapter is plugged in", "plug in a wireless USB adapter and try again"};
}
