// Messages of a radio's driver, as the listing tool reads them: none is read beyond its end; a network comes out as a
// row that can be read back, or not at all; and so does news of a scan.
//
// Runs: 60000
// Covers: appliance/sbin/radio.cpp appliance/sbin/elements.cpp appliance/sbin/listing.cpp common/scan_end.h
#include <cstring>
#include <memory>

#include "appliance/sbin/radio.h"
#include "common/scan_end.h"
#include "tests/fuzz/row.h"

namespace {

// A message without a byte more than it has, so that reading one is noticed.
class Message {
 public:
  Message(std::uint8_t command, const std::uint8_t* data, std::size_t size)
      : size_(NLMSG_HDRLEN + size), bytes_(std::make_unique<char[]>(size_)) {
    header()->nlmsg_len = static_cast<__u32>(size_);
    std::memcpy(bytes_.get() + NLMSG_HDRLEN, data, size);
    if (size > 0) bytes_[NLMSG_HDRLEN] = static_cast<char>(command);
  }

  nlmsghdr* header() { return reinterpret_cast<nlmsghdr*>(bytes_.get()); }

 private:
  std::size_t size_;
  std::unique_ptr<char[]> bytes_;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  constexpr unsigned kInterface = 3;
  Message scanned(NL80211_CMD_NEW_SCAN_RESULTS, data, size);
  (void)nl80211::NewsIn(scanned.header(), kInterface, 2);

  const std::optional<iwlist::Network> network = iwlist::NetworkOfMessage(scanned.header());
  if (!network) return 0;
  RequireRow(*network);
  // The same network once more, as a driver may describe it: it is listed once.
  iwlist::Network other = *network;
  other.seenMsAgo += 1;
  const std::string listing = iwlist::Listing({other, *network}, iwlist::Reader::kProgram);
  Require(listing.ends_with("\n" + iwlist::Row(*network, iwlist::Reader::kProgram)), "a network is listed once",
          {listing});
  const bool isObstacle = network->description.obstacle != iwlist::Obstacle::kNone;
  Require(iwlist::ListingOfObstacles({*network}).empty() != isObstacle, "an obstacle is told", {listing});
  return 0;
}
