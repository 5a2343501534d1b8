// watch: the status as it changes.
#ifndef MERO_TOOLS_WATCH_H
#define MERO_TOOLS_WATCH_H

#include "work/program.h"

// Shows the status now and whenever it has changed, `times` times or, with 0, until the program is ended or nobody
// reads on.
void Watch(const Program& program, int times);

#endif  // MERO_TOOLS_WATCH_H
