// From a command line to an exit status.
#include "app/run.h"

#include <fcntl.h>
#include <unistd.h>

#include <clocale>
#include <cstdio>
#include <exception>

#include "app/help.h"
#include "app/options.h"
#include "base/require.h"
#include "work/library_log.h"

namespace {

int Status(Exit exit) {
  return static_cast<int>(exit);
}

// A file that is opened later must not get the number of a standard descriptor that is closed. The directions are the
// wrong ones on purpose: using such a descriptor fails as it did.
void FillStandardDescriptors() {
  for (const int fd : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
    if (::fcntl(fd, F_GETFD) < 0) Require(::open("/dev/null", fd == STDIN_FILENO ? O_WRONLY : O_RDONLY), "/dev/null");
  }
}

int Report(const Output& output, const Failure& failure) {
  output.Failed(failure);
  Remark(std::string("merowireless: ") + failure.what() + ": " + failure.advice());
  return Status(failure.exit());
}

int RunCommand(const Options& options) {
  const Program program{.output = Output(options.form, TerminalOf(STDOUT_FILENO)),
                        .errors = TerminalOf(STDERR_FILENO),
                        .verbose = options.verbose};
  try {
    options.command(program);
  } catch (const Failure& failure) {
    return Report(program.output, failure);
  } catch (const Interrupted&) {
    return Report(program.output,
                  {Exit::kInterrupted, "interrupted, and nothing of the command goes on", "run it again"});
  } catch (const std::exception& failure) {
    return Report(program.output, {Exit::kFailed, failure.what(), "-v shows how far it came"});
  }
  return Status(Exit::kDone);
}

// Turns success into failure when the output could not be written.
int Finish(int status) {
  if (std::fflush(stdout) == 0 && std::ferror(stdout) == 0) return status;
  Remark("merowireless: the output could not be written: look at where it goes");
  return status == Status(Exit::kDone) ? Status(Exit::kFailed) : status;
}

}  // namespace

int RunProgram(int argc, const char* const* argv) {
  FillStandardDescriptors();
  std::setlocale(LC_CTYPE, "");
  try {
    const Options options = ParseOptions(argc, argv);
    if (options.verbose) library_log::ShowLines();
    return Finish(RunCommand(options));
  } catch (const Help& help) {
    constexpr std::size_t kCustomary = 80;
    const std::size_t width = TerminalOf(STDOUT_FILENO).width;
    std::fputs(FittedHelp(help.text, width > 0 ? width : kCustomary).c_str(), stdout);
    return Finish(Status(Exit::kDone));
  } catch (const WrongUsage& wrong) {
    const Output output(wrong.form, TerminalOf(STDOUT_FILENO));
    return Finish(Report(output, wrong.why));
  }
}
