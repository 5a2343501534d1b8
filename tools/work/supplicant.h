// What the supplicant says about a join that is under way.
#ifndef MERO_TOOLS_SUPPLICANT_H
#define MERO_TOOLS_SUPPLICANT_H

#include <chrono>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "base/text.h"
#include "common/descriptor.h"
#include "work/listener.h"

// Why a join failed. The greater value tells more.
enum class Verdict {
  kNone,
  kNotFound,      // no such network in range
  kRefused,       // the access point refuses this station
  kSecretRefused  // it refuses the secret
};

// The verdict of one event, such as "<3>CTRL-EVENT-NETWORK-NOT-FOUND".
Verdict VerdictOf(std::string_view event);

// Whether the supplicant has come to a verdict by itself, and will not try the network again for longer than a join
// lasts. What it says of a single step, such as a handshake, is none.
bool IsFinal(std::string_view event);

// The access point of an event that tells of being its station, such as "<3>Associated with 02:00:00:00:01:00".
std::optional<Address> AccessPointIn(std::string_view event);

// Listens to the control socket of the supplicant. Supplicants may come and go meanwhile.
class SupplicantListener final : public Listener {
 public:
  // Calls `greet` as soon as the first supplicant is there.
  explicit SupplicantListener(std::string path, std::function<void()> greet = {});

  // -1 as long as there is no supplicant.
  int fd() const override { return socket_.get(); }

  // Finds the supplicant, and finds out that it is gone.
  void Tick() override;

  std::chrono::milliseconds interval() const override;

  void Receive() override;

  // The greatest so far.
  Verdict verdict() const { return verdict_; }

  // Whether it is final.
  bool isFinal() const { return final_; }

  // Those that the supplicant was the station of, the last one at the end.
  const std::vector<Address>& accessPoints() const { return accessPoints_; }

 private:
  bool Attach();

  std::string path_;
  std::function<void()> greet_;
  Descriptor socket_;
  std::chrono::steady_clock::time_point lastAsked_;
  Verdict verdict_ = Verdict::kNone;
  bool final_ = false;
  std::vector<Address> accessPoints_;
};

#endif  // MERO_TOOLS_SUPPLICANT_H
