// autoconnect --keep: a known network is joined, and joined again whenever the connection was lost.
#include "commands/keep.h"

#include <poll.h>
#include <sys/stat.h>

#include <algorithm>
#include <cstdio>
#include <iterator>
#include <optional>
#include <string>

#include "base/pid_file.h"
#include "base/signals.h"
#include "commands/connection.h"
#include "common/paths.h"
#include "model/addressing.h"
#include "model/library.h"
#include "model/situation.h"
#include "model/status.h"
#include "work/attempt.h"
#include "work/news.h"

namespace {

using Clock = std::chrono::steady_clock;
using std::chrono::milliseconds;

// Some drivers do not announce every change, and the kernel knows nothing of the radio's switch or of a network that is
// saved.
constexpr milliseconds kLookInterval{5000};

// What has been so for a moment is told: an adapter that is plugged in is not announced yet, an address is on its way.
constexpr milliseconds kMoment{500};

// While a network is being joined, an access point that somebody sets up has to find nothing in its way.
constexpr milliseconds kGuardInterval{200};

// The first pause. Whoever has given the adapter free may not be done with it yet, so an attempt waits that long then.
constexpr std::chrono::seconds kFirstPause{5};

const char* WaitingText(Situation situation) {
  switch (situation) {
    case Situation::kNoAdapter:
      return "waiting until an adapter is plugged in";
    case Situation::kRadioOff:
      return "waiting until the radio is switched on";
    case Situation::kAccessPoint:
      return "waiting while the adapter is an access point's";
    case Situation::kLeftAlone:
      return "waiting since somebody has disconnected; `merowireless connect` or `autoconnect` joins again";
    case Situation::kCell:
      return "waiting while the adapter looks for the others of its ad-hoc cell";
    case Situation::kUntold:
      return "waiting while nobody knows whether the adapter is connected";
    case Situation::kUnannounced:
      return "waiting until the adapter is announced, so that its radio may be used";
    case Situation::kConnected:
    case Situation::kFree:
      break;
  }
  return nullptr;
}

// The file of the known networks as it stands: each save puts another one in its place.
struct Stamp {
  ino_t file = 0;
  time_t seconds = 0;

  bool operator==(const Stamp&) const = default;
};

Stamp StampOfKnown() {
  struct stat file{};
  return ::stat(kKnownNetworksPath, &file) == 0 ? Stamp{file.st_ino, file.st_mtim.tv_sec} : Stamp{};
}

class Keeper {
 public:
  Keeper(const Program& program, const Keeping& keeping) : program_(program), keeping_(keeping) {}

  void Run() {
    while (!ended_) {
      Look();
      if (isDue())
        Try();
      else if (isLeaseDue())
        LeaseAnew();
      else
        Wait();
    }
  }

 private:
  bool isDue() const { return situation_ == Situation::kFree && Clock::now() >= due_; }

  bool isLeaseDue() const { return situation_ == Situation::kConnected && Clock::now() >= due_ && IsLeaseAbandoned(); }

  // ---- What is so ----

  void Look() {
    const Status status = ReadStatus();
    const Situation situation = SituationOf(status);
    if (situation != situation_) Enter(situation);
    if (situation == Situation::kFree) MindWhatIsSaved();
    if (situation == Situation::kConnected) connection_ = program_.output.Name(status.name);
    TellOnceItStays(SentenceOf(situation, status), status);
  }

  // Nothing where an attempt is what there will be to tell of.
  std::string SentenceOf(Situation situation, const Status& status) const {
    if (situation == Situation::kConnected) return ConnectionText(program_.output, status);
    const char* szWaiting = WaitingText(situation);
    return szWaiting != nullptr ? szWaiting : "";
  }

  // At the start an attempt is made at once, unless a supplicant of former times is at it.
  void Enter(Situation situation) {
    const std::optional<Situation> former = std::exchange(situation_, situation);
    pause_ = std::min(kFirstPause, keeping_.longestPause);
    if (WaitingText(situation) != nullptr) connection_.clear();
    if (situation != Situation::kFree) return;
    const bool isLeftToSupplicant =
        former ? former == Situation::kConnected : IsDaemonThere(kSupplicantPidPath, "wpa_supplicant");
    earliest_ = Clock::now();
    if (isLeftToSupplicant)
      earliest_ += keeping_.patience;
    else if (former)
      earliest_ += pause_;
    due_ = earliest_;
  }

  // Somebody who has saved a network does not want to wait until a long pause is over.
  void MindWhatIsSaved() {
    const Stamp stamp = StampOfKnown();
    if (std::exchange(stamp_, stamp) == stamp) return;
    pause_ = std::min(kFirstPause, keeping_.longestPause);
    due_ = std::min(due_, std::max(earliest_, Clock::now() + pause_));
  }

  void Wait() {
    const auto left = std::chrono::ceil<milliseconds>(due_ - Clock::now());
    milliseconds patience = situation_ == Situation::kFree ? std::min(left, kLookInterval) : kLookInterval;
    if (!seen_.empty() && seen_ != told_) patience = std::min(patience, kMoment);
    patience = std::max(patience, milliseconds{0});
    pollfd waited[] = {{news_.get(), POLLIN, 0}, {signals_.fd(), POLLIN, 0}};
    if (::poll(waited, std::size(waited), static_cast<int>(patience.count())) <= 0) return;
    if (signals_.HasCome()) ended_ = true;
    Drain(news_);
  }

  // ---- Attempts ----

  void Try() {
    if (!connection_.empty()) {
      Tell("the connection to " + connection_ + " is lost, and a known network is joined anew", ReadStatus());
      connection_.clear();
    }
    Attempt attempt([this] { AutoConnect(program_, JoinLockFor::kKeeper); });
    const bool gaveWay = Guard(attempt);
    const auto failure = attempt.Result();
    due_ = Clock::now() + pause_;
    if (gaveWay) return;
    if (failure && failure->exit() == Exit::kBusy) return;  // somebody else joins a network: that was no attempt
    if (failure) TellFailure(*failure);
    pause_ = std::min(2 * pause_, keeping_.longestPause);
  }

  // The kernel ends a client when memory runs out, say. This does not take long and goes before everything else: taken
  // back, it would leave the connection without an address.
  void LeaseAnew() {
    Tell("the DHCP client was killed, and an address is asked for anew", ReadStatus());
    const auto failure = Attempt([this] { LeaseAgain(program_); }).Result();
    due_ = Clock::now() + pause_;
    pause_ = std::min(2 * pause_, keeping_.longestPause);
    if (failure && failure->exit() != Exit::kBusy) TellFailure(*failure);
  }

  // Until the attempt has ended. An access point goes before it, the end of the program, and what somebody wants to do
  // with the adapter; whether that was so.
  bool Guard(Attempt& attempt) {
    bool gaveWay = false;
    pollfd waited[] = {{attempt.fd(), POLLIN, 0}, {signals_.fd(), POLLIN, 0}};
    const auto& [ended, signals] = waited;
    while (ended.revents == 0) {
      ::poll(waited, std::size(waited), static_cast<int>(kGuardInterval.count()));
      if (signals.revents != 0 && signals_.HasCome()) ended_ = true;
      if (!ended_ && !IsForAccessPoint() && !IsKeeperInTheWay()) continue;
      attempt.Interrupt();
      gaveWay = true;
    }
    return gaveWay;
  }

  // ---- What is told ----

  void TellOnceItStays(const std::string& sentence, const Status& status) {
    const auto now = Clock::now();
    if (std::exchange(seen_, sentence) != sentence) seenSince_ = now;
    if (!sentence.empty() && now - seenSince_ >= kMoment) Tell(sentence, status);
  }

  // Nobody may read it any more, and the connection is kept all the same; the exit status says that it was not written.
  void Tell(const std::string& sentence, const Status& status) {
    if (!IsNews(sentence)) return;
    program_.output.Done(sentence, "status", StatusFields(), status);
    std::fflush(stdout);
  }

  void TellFailure(const Failure& failure) {
    if (!IsNews(failure.what())) return;
    program_.output.Failed(failure);
    std::fflush(stdout);
    Remark(std::string("merowireless: ") + failure.what() + ": " + failure.advice());
  }

  bool IsNews(const std::string& sentence) { return std::exchange(told_, sentence) != sentence; }

  const Program& program_;
  const Keeping keeping_;
  const Signals signals_;
  const Descriptor news_ = News();

  std::optional<Situation> situation_;
  std::string connection_;      // the network, while it is not told that it was lost
  Clock::time_point earliest_;  // before it no attempt is made
  Clock::time_point due_;       // of the next attempt, when the adapter is free
  std::chrono::seconds pause_{0};
  Stamp stamp_ = StampOfKnown();
  std::string seen_;  // what is so, in a sentence
  Clock::time_point seenSince_;
  std::string told_;
  bool ended_ = false;
};

}  // namespace

void KeepConnected(const Program& program, const Keeping& keeping) {
  Keeper(program, keeping).Run();
}
