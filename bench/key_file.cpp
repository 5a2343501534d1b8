// What settings are compared with.
#include "key_file.h"

#include <glib.h>

#include <algorithm>
#include <cstring>
#include <span>
#include <utility>
#include <vector>

namespace {

GKeyFile* Load(const char* szPath) {
  GKeyFile* file = g_key_file_new();
  if (!g_key_file_load_from_file(file, szPath, G_KEY_FILE_NONE, nullptr)) g_error("cannot load %s", szPath);
  return file;
}

// Calls `visit(key, value)` for each pair of a group.
template <class Visit>
void ForEachPair(GKeyFile* file, const char* szGroup, Visit visit) {
  gsize count = 0;
  gchar** keys = g_key_file_get_keys(file, szGroup, &count, nullptr);
  for (const gchar* szKey : std::span(keys, count)) {
    gchar* szValue = g_key_file_get_string(file, szGroup, szKey, nullptr);
    visit(szKey, szValue);
    g_free(szValue);
  }
  g_strfreev(keys);
}

}  // namespace

size_t SortedGroupsOfKeyFile(const char* szPath) {
  GKeyFile* file = Load(szPath);
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

size_t SizeOfValuesInKeyFile(const char* szPath, const char* szGroup) {
  GKeyFile* file = Load(szPath);
  size_t size = 0;
  ForEachPair(file, szGroup, [&](const gchar*, const gchar* szValue) { size += std::strlen(szValue); });
  g_key_file_free(file);
  return size;
}

void SaveGroupOfKeyFile(const char* szPath, const char* szGroup) {
  GKeyFile* file = Load(szPath);
  ForEachPair(file, szGroup,
              [&](const gchar* szKey, const gchar* szValue) { g_key_file_set_string(file, szGroup, szKey, szValue); });
  if (!g_key_file_save_to_file(file, szPath, nullptr)) g_error("cannot save %s", szPath);
  g_key_file_free(file);
}
