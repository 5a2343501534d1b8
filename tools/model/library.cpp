// The library in this program's own words.
#include "model/library.h"

#include <search.h>

#include <cstddef>
#include <cstdlib>
#include <cstring>

#include "model/ap_state.h"
#include "model/kernel_switch.h"
#include "model/library_lines.h"
#include "model/obstacles.h"
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
    RefuseWhileRadioIsOff();
    return Failed("the adapter's interface cannot be brought up", "plug the adapter out and in, and try again");
  }
  return Failed("the adapter gave no scan results", "try again with --renew; -v shows what the library reports");
}

// What a scan gave: its result, and the access points.
std::string Scanned(WIRELESS_SCAN scan) {
  Ring<Network> ring;
  const int result = MEROWirelessNetworkScan(scan, ring.head());
  return Pack(result, ring.Records());
}

// The same, of access points that are to be joined.
std::string ScannedToJoin(WIRELESS_SCAN scan) {
  Ring<Network> ring;
  const int result = MEROWirelessNetworkScan(scan, ring.head());
  std::vector<Network> networks = ring.Records();
  HideProtectionOfObstacles(networks);
  return Pack(result, networks);
}

// Fails when the scan did.
std::vector<Network> AccessPointsOf(const std::string& bytes) {
  std::vector<Network> networks;
  if (Unpack(bytes, networks) < 0) throw ScanFailed();
  std::ranges::stable_sort(networks, std::greater{}, &Network::signal);
  return networks;
}

}  // namespace

std::vector<Network> InRange(const Program& program, WIRELESS_SCAN scan) {
  return AccessPointsOf(RunBytes(program.Doing("scanning"), [scan] { return Scanned(scan); }));
}

std::vector<Network> InRangeToJoin(const Task& task, WIRELESS_SCAN scan) {
  return AccessPointsOf(RunBytes(task, [scan] { return ScannedToJoin(scan); }));
}

std::optional<std::vector<Network>> InRangeOnCall(const Program& program, const std::string& name) {
  if (ParseAddress(name)) return std::nullopt;
  const Task task = program.Doing("looking for " + program.output.Name(name));
  const std::string answers = RunBytes(task, [&] {
    return CallNetwork(MEROWirelessInterfaceGet(), name) ? ScannedToJoin(WIRELESS_SCAN_LAST) : std::string();
  });
  if (answers.empty()) return std::nullopt;
  return AccessPointsOf(answers);
}

std::vector<KnownNetwork> Known(Order order) {
  Ring<KnownNetwork> ring;
  const auto list = order == Order::kByTime ? MEROWirelessConfEnumByAtime : MEROWirelessConfEnum;
  if (list(ring.head()) < 0) {
    throw Failed("the known networks cannot be read", "-v shows what the library reports");
  }
  return ring.Records();
}

std::vector<Network> LookFor(const Program& program, const std::string& name,
                             const std::function<bool(const Network&)>& isWanted) {
  const Task task = program.Doing("looking for " + program.output.Name(name));
  auto last = InRangeToJoin(task, WIRELESS_SCAN_LAST);
  if (std::ranges::any_of(last, isWanted)) return last;
  if (auto answers = InRangeOnCall(program, name)) return *std::move(answers);
  return InRangeToJoin(task, WIRELESS_SCAN_RENEW);
}

bool IsNamed(const Network& network, const std::string& name) {
  const std::optional<Address> address = ParseAddress(name);
  return address ? std::ranges::equal(*address, network.bssid) : name == network.szEssid;
}

void RequireName(const std::string& name) {
  if (ParseAddress(name)) throw Wrong("a text that is an address can be no name", "give the network another one");
}

Network FindInRange(const Program& program, const std::string& name) {
  RequireScanning();
  const auto isWanted = [&](const Network& network) { return IsNamed(network, name); };
  const auto networks = LookFor(program, name, isWanted);
  const auto found = std::ranges::find_if(networks, isWanted);
  if (found != networks.end()) return *found;
  throw Failure(Exit::kOutOfRange, "no network named " + program.output.Name(name) + " is in range",
                "`merowireless scan --renew` shows those that are");
}

std::vector<KnownNetwork> AllKnown(const std::string& name) {
  std::vector<KnownNetwork> known = Known(Order::kByTime);
  std::erase_if(known, [&](const KnownNetwork& other) { return !IsNamed(other.network, name); });
  return known;
}

std::vector<KnownNetwork> AllCalled(const std::string& essid) {
  std::vector<KnownNetwork> known = Known(Order::kByTime);
  std::erase_if(known, [&](const KnownNetwork& other) { return essid != other.network.szEssid; });
  return known;
}

std::optional<KnownNetwork> FindCalled(const std::string& essid) {
  const std::vector<KnownNetwork> known = AllCalled(essid);
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
