// What the program can be told to do.
#ifndef MERO_TESTS_TOOLS_COMMANDS_H
#define MERO_TESTS_TOOLS_COMMANDS_H

inline constexpr const char* kCommands[] = {"scan",        "known",      "save",   "forget", "connect",
                                            "autoconnect", "disconnect", "status", "watch",  "address",
                                            "gateway",     "adhoc",      "ap",     "mode",   "radio"};

#endif  // MERO_TESTS_TOOLS_COMMANDS_H
