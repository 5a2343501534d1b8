// The kernel's news about links and addresses.
#ifndef MERO_TOOLS_NEWS_H
#define MERO_TOOLS_NEWS_H

#include "common/descriptor.h"

// Readable whenever there is some. It says that something has changed, and whoever waits for it looks for himself.
Descriptor News();

// Lets what has come go by.
void Drain(const Descriptor& news);

#endif  // MERO_TOOLS_NEWS_H
