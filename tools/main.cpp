// merowireless: the appliance's wireless networking, managed from a command line.
#include "app/run.h"

int main(int argc, char** argv) {
  return RunProgram(argc, argv);
}
