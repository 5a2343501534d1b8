// Calls in processes of their own: what is sent, what is heard meanwhile, and that nothing is left behind.
#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include <stdexcept>

#include "running.h"
#include "work/frames.h"
#include "work/process_tree.h"
#include "work/worker.h"

using testing::ElementsAre;

namespace {

struct Ends {
  Ends() { EXPECT_EQ(::pipe2(fds, O_CLOEXEC), 0); }
  ~Ends() {
    for (int fd : fds) ::close(fd);
  }

  int fds[2];
};

TEST(Frames, AreGivenOnceTheyHaveComeWhole) {
  Ends sent;
  SendFrame(sent.fds[1], Frame::Kind::kLine, "a line");
  char bytes[64];
  const ssize_t first = ::read(sent.fds[0], bytes, sizeof bytes);
  SendFrame(sent.fds[1], Frame::Kind::kResult, std::string("\0\1", 2));
  const ssize_t size = first + ::read(sent.fds[0], bytes + first, sizeof bytes - static_cast<std::size_t>(first));
  Frames frames;
  std::vector<std::string> given;
  for (ssize_t i = 0; i < size; ++i) {
    Ends piece;
    ASSERT_EQ(::write(piece.fds[1], &bytes[i], 1), 1);
    EXPECT_TRUE(frames.Read(piece.fds[0]));
    const auto frame = frames.Next();
    ASSERT_EQ(frame.has_value(), i + 1 == first || i + 1 == size) << i;
    if (frame) given.push_back(static_cast<char>(frame->kind) + frame->bytes);
  }
  EXPECT_THAT(given, ElementsAre("La line", std::string("R\0\1", 3)));
}

// The child has a holder from the fork on.
TEST(ProcessTree, EndsWithItsHolderWhateverFails) {
  Lifeline lifeline;
  EXPECT_THROW(
      {
        const ProcessTree child([] {
          ::alarm(60);  // should nothing else end it
          while (true) ::pause();
        });
        throw std::runtime_error("something else");
      },
      std::runtime_error);
  EXPECT_TRUE(lifeline.IsFree());
}

TEST(ProcessTree, LeavesADaemonAloneWhenItIsReleased) {
  Lifeline lifeline;
  Ends daemon;
  {
    ProcessTree child([&] {
      if (::fork() != 0) ::_exit(0);
      ::setsid();
      ::close(daemon.fds[1]);
      char order;
      ::_exit(::read(daemon.fds[0], &order, 1) < 0);
    });
    const Descriptor end = child.Watch();
    pollfd ended{end.get(), POLLIN, 0};
    ASSERT_EQ(::poll(&ended, 1, 20'000), 1);
    child.Release();
  }
  EXPECT_FALSE(lifeline.IsFree());
}

// Hears one event, and counts.
class Counter : public Listener {
 public:
  int fd() const override { return pipe_.fds[0]; }

  void Tick() override {
    if (++ticks_ > 1) return;
    EXPECT_EQ(::write(pipe_.fds[1], "!", 1), 1);
  }

  std::chrono::milliseconds interval() const override { return std::chrono::milliseconds(5); }

  void Receive() override {
    pollfd readable{pipe_.fds[0], POLLIN, 0};
    char event;
    if (::poll(&readable, 1, 0) > 0) events_ += ::read(pipe_.fds[0], &event, 1) == 1 ? 1 : 0;
  }

  int ticks() const { return ticks_; }
  int events() const { return events_; }

 private:
  Ends pipe_;
  int ticks_ = 0;
  int events_ = 0;
};

TEST(Worker, LetsAnyListenerHearWhatHappensMeanwhile) {
  Counter counter;
  const Task task{.errors = {}, .doing = "", .listener = &counter};
  EXPECT_EQ(::Run<int>(task, [] { return ::usleep(250'000), 7; }), 7);
  EXPECT_EQ(counter.events(), 1);
  EXPECT_GT(counter.ticks(), 10);
}

}  // namespace
