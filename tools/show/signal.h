// How strongly something is heard.
#ifndef MERO_TOOLS_SIGNAL_H
#define MERO_TOOLS_SIGNAL_H

#include "show/output.h"

// In per cent. Some drivers give dBm, which is below 0: by custom -50 dBm is all and -100 dBm nothing.
int QualityOf(int signal);

// Bars, and the driver's own figure.
Shown ShowSignal(int signal, bool utf8);

#endif  // MERO_TOOLS_SIGNAL_H
