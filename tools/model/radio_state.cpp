// Whether the radio may be used.
#include "model/radio_state.h"

#include "platform.h"
#include "wireless.h"

namespace {

RadioState StateOf(int answer, KernelBlock block) {
  if (answer == 0 || block == KernelBlock::kSet || block == KernelBlock::kOfHardware) return RadioState::kOff;
  return answer == 1 ? RadioState::kOn : RadioState::kUnknown;
}

}  // namespace

Radio ReadRadio() {
  const KernelBlock block = KernelBlockOf(MEROWirelessInterfaceGet());
  return {StateOf(MEROWirelessCheckBlock(), block), block};
}

const char* WordOf(RadioState state) {
  switch (state) {
    case RadioState::kUnknown:
      return "unknown";
    case RadioState::kOff:
      return "off";
    case RadioState::kOn:
      return "on";
  }
  return "";
}
