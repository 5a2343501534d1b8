// The record of the last join.
#include "platform/core/connection_record.h"

#include <optional>
#include <string_view>

#include "common/log.h"
#include "common/paths.h"
#include "common/text.h"
#include "platform/base/file_read.h"
#include "platform/base/number.h"
#include "platform/base/shared_directory.h"

namespace {

// Takes the last line off a text. The record is read from its end, since the name on its first line may hold anything,
// also line feeds.
std::string_view TakeLastLine(std::string_view& text) {
  if (text.ends_with('\n')) text.remove_suffix(1);
  const size_t begin = text.rfind('\n') + 1;  // 0 when there is none
  const std::string_view line = Slice(text, begin);
  text.remove_suffix(line.size());
  return line;
}

// A number from 0 to `greatest`. For anything else it is 0, which means unknown in each of the enumerations.
int NumberUpTo(int greatest, std::string_view text) {
  const int number = TakeNumber(text).value_or(0);
  return text.empty() && number >= 0 && number <= greatest ? number : 0;
}

}  // namespace

Result<ConnectionRecord> RecordOfConnectionTo(const Bssid& accessPoint) {
  Result<Bytes> file = ReadFile(kConnectionRecordPath);
  if (file.error() == kForeign) LOG("%s is not believed: somebody else has put it there", kConnectionRecordPath);
  if (file.error() == ENOENT || file.error() == kForeign) return ConnectionRecord{};
  if (!file.ok()) return file.status();

  std::string_view text = file->view();
  const std::string_view bssid = TakeLastLine(text);
  (void)TakeLastLine(text);  // the encryption
  const std::string_view auth = TakeLastLine(text);
  const std::string_view protocol = TakeLastLine(text);
  if (ParseBssid(bssid) != accessPoint) return ConnectionRecord{};
  return ConnectionRecord{static_cast<WIRELESS_PROTOCOL>(NumberUpTo(WIRELESS_PROTO_11BN, protocol)),
                          static_cast<WIRELESS_AUTH>(NumberUpTo(WIRELESS_AUTH_WPA2EAP, auth))};
}
