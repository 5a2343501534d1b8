// The headers in C++.
#include "layout.h"
