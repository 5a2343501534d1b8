// Whether the radio may be used: by its switch in the settings, and by that of the kernel.
#ifndef MERO_TOOLS_RADIO_STATE_H
#define MERO_TOOLS_RADIO_STATE_H

#include "model/kernel_switch.h"

enum class RadioState {
  kUnknown,  // no adapter has been announced
  kOff,      // one of the two switches is enough
  kOn,
};

struct Radio {
  RadioState state = RadioState::kUnknown;
  KernelBlock block = KernelBlock::kUnknown;
};

Radio ReadRadio();

const char* WordOf(RadioState state);

#endif  // MERO_TOOLS_RADIO_STATE_H
