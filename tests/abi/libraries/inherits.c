/* Runs a program that says what it has open, by a caller that has more open than a program is to have. */
#include <fcntl.h>
#include <stdlib.h>
#include <unistd.h>

#include "platform.h"

int main(void) {
  const int open_at_exec = open("/dev/null", O_RDONLY);
  if (open_at_exec < 0 || dup2(open_at_exec, 100) < 0) return EXIT_FAILURE;
  return PLIBCExec("/bin/ls", "/proc/self/fd", NULL, NULL, NULL) == 0 ? EXIT_SUCCESS : EXIT_FAILURE;
}
