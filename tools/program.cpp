// From a command line to an exit status.
#include "program.h"

#include <unistd.h>

#include <clocale>
#include <cstdio>
#include <exception>

#include "library_log.h"
#include "options.h"

namespace {

int Status(Exit exit) {
  return static_cast<int>(exit);
}

int Explain(const Usage& usage) {
  if (usage.exit == Exit::kDone) {
    std::fputs(usage.text.c_str(), stdout);
  } else {
    std::fprintf(stderr, "merowireless: %s; merowireless --help tells more\n", Harmless(usage.text, false).c_str());
  }
  return Status(usage.exit);
}

int Report(const Output& output, const Failure& failure) {
  output.Failed(failure);
  std::fprintf(stderr, "merowireless: %s: %s\n", failure.what(), failure.advice().c_str());
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
    return Report(program.output, {Exit::kInterrupted, "interrupted", "nothing of it goes on"});
  } catch (const std::exception& failure) {
    return Report(program.output, {Exit::kFailed, failure.what(), "-v shows how far it came"});
  }
  return Status(Exit::kDone);
}

// What was written and did not arrive is no success.
int Finish(int status) {
  if (std::fflush(stdout) == 0 && std::ferror(stdout) == 0) return status;
  std::fputs("merowireless: the output could not be written: look at where it goes\n", stderr);
  return status == Status(Exit::kDone) ? Status(Exit::kFailed) : status;
}

}  // namespace

int RunProgram(int argc, const char* const* argv) {
  std::setlocale(LC_CTYPE, "");
  try {
    const Options options = ParseOptions(argc, argv);
    if (options.verbose) library_log::ShowLines();
    return Finish(RunCommand(options));
  } catch (const Usage& usage) {
    return Finish(Explain(usage));
  }
}
