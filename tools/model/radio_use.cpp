// What uses the radio.
#include "model/radio_use.h"

#include <string_view>

#include "base/text.h"
#include "common/paths.h"
#include "model/library.h"
#include "model/settings_change.h"
#include "model/situation.h"
#include "model/status.h"

namespace {

constexpr char kKey[] = "use";
constexpr char kFormat[] = "%s=\"%s\"\n";

// The note is one of these words; the name of a network may be any bytes, and is in hexadecimal.
constexpr std::string_view kAccessPoint = "access-point";
constexpr std::string_view kNetwork = "network:";

}  // namespace

RadioUse ReadRadioUse() {
  if (IsForAccessPoint()) return {.isAccessPoint = true, .network = ""};
  return {.isAccessPoint = false, .network = ReadStatus().name};
}

RadioUse NotedRadioUse() {
  char szNote[128];
  if (PLIBCFileGetKeyValue(kRadioUsePath, kKey, szNote, sizeof szNote, 0) <= 0) return {};
  const std::string_view note = szNote;
  if (note == kAccessPoint) return {.isAccessPoint = true, .network = ""};
  if (!note.starts_with(kNetwork)) return {};
  return {.isAccessPoint = false, .network = BytesOfHex(note.substr(kNetwork.size()))};
}

void NoteRadioUse(const RadioUse& use) {
  if (use == RadioUse{}) return ForgetRadioUse();
  const std::string note(use.isAccessPoint ? std::string(kAccessPoint) : std::string(kNetwork) + Hex(use.network));
  if (PLIBCFileSetKeyValue(kRadioUsePath, kKey, note.c_str(), kFormat) > 0) return;
  throw Failed("what uses the radio could not be noted", "is there room on the disk? -v shows more");
}

void ForgetRadioUse() {
  (void)RemoveSettings(kRadioUsePath);  // a note that stays is replaced when the next one is taken
}
