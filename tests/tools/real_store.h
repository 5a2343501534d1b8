// The file of known networks as it really is, for tests of what stands in it.
#ifndef MERO_TESTS_TOOLS_REAL_STORE_H
#define MERO_TESTS_TOOLS_REAL_STORE_H

// What reads and writes the known networks is the library and the platform from now on, and no fake.
void UseRealStore();

#endif  // MERO_TESTS_TOOLS_REAL_STORE_H
