// What uses the radio: it is noted while the radio is switched off, so that it can be brought back.
#ifndef MERO_TOOLS_RADIO_USE_H
#define MERO_TOOLS_RADIO_USE_H

#include <string>

struct RadioUse {
  bool isAccessPoint = false;
  std::string network;  // the name of the one that is connected to

  bool operator==(const RadioUse&) const = default;
};

// At this moment.
RadioUse ReadRadioUse();

// The note; nothing when there is none. Taking one down fails when it cannot be written.
RadioUse NotedRadioUse();
void NoteRadioUse(const RadioUse& use);
void ForgetRadioUse();

#endif  // MERO_TOOLS_RADIO_USE_H
