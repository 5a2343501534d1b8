// For what a header has that the constants of tests are made of. The language has it made first; clang forgets that
// where it optimizes a program as a whole, and the constants were made of nothing.
#ifndef MERO_TESTS_SUPPORT_EARLY_H
#define MERO_TESTS_SUPPORT_EARLY_H

#define EARLY [[gnu::init_priority(200)]]

#endif  // MERO_TESTS_SUPPORT_EARLY_H
