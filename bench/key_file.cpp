// What the enumeration of known networks is compared with.
#include "key_file.h"

#include <glib.h>

#include <algorithm>
#include <span>
#include <utility>
#include <vector>

size_t SortedGroupsOfKeyFile(const char* szPath) {
  GKeyFile* file = g_key_file_new();
  if (!g_key_file_load_from_file(file, szPath, G_KEY_FILE_NONE, nullptr)) g_error("cannot load %s", szPath);

  gsize count = 0;
  gchar** names = g_key_file_get_groups(file, &count);
  std::vector<std::pair<gint64, const gchar*>> groups;
  groups.reserve(count);
  for (const gchar* szName : std::span(names, count)) {
    groups.emplace_back(g_key_file_get_int64(file, szName, "ACCESS_TIME", nullptr), szName);
  }
  std::ranges::stable_sort(groups, std::greater(), &std::pair<gint64, const gchar*>::first);

  g_strfreev(names);
  g_key_file_free(file);
  return groups.size();
}
