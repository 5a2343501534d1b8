// Changing a file. Its content is replaced as a whole, under a lock that keeps other processes from changing it.
#ifndef MERO_PLATFORM_FILE_EDIT_H
#define MERO_PLATFORM_FILE_EDIT_H

#include <sys/types.h>

#include <algorithm>
#include <climits>
#include <string_view>

#include "common/descriptor.h"
#include "platform/base/bytes.h"
#include "platform/base/result.h"

// Another process has kept a file's lock for as long as this one would wait. An error of our own: no errno says so.
inline constexpr int kLockKept = -2;

// What a file is to hold: a beginning and an end of its old text, and what is new between them. What stays is not
// copied, since a file of many networks is long, and a change of it short.
struct Revision {
  std::string_view before;
  Bytes content;
  std::string_view behind;

  size_t size() const { return before.size() + content.view().size() + behind.size(); }

  // Whether the old text stays as it is.
  bool Keeps(std::string_view text) const {
    const std::string_view added = content.view();
    return size() == text.size() && std::equal(added.begin(), added.end(), text.begin() + before.size());
  }
};

class FileEdit {
 public:
  FileEdit() = default;
  FileEdit(FileEdit&&) = default;
  FileEdit& operator=(FileEdit&&) = delete;  // a lock and the path of its file belong together
  ~FileEdit();

  // Locks a file, following symbolic links, and reads it. One that is missing is created with mode `mode`, whatever the
  // umask, or is ENOENT when `mode` is 0. Blocks for up to 20 s while another process edits the file; kLockKept then.
  static Result<FileEdit> Open(const char* szPath, mode_t mode);

  // What the file holds; a revision's beginning and end are parts of it.
  std::string_view text() const { return text_.view(); }

  // Gives up, and removes the file again if it was made for this edit.
  void Abandon();

  // Replaces the content, unless it failed to be built. The file holds the old content or the new one, whole, whenever
  // this is interrupted. What is there already is flushed and not written: a flash wears out, and most of what is set
  // has been set before.
  Status Commit(const Revision& revision);

 private:
  Status Lock(int& tries);
  Status Read();

  Descriptor lock_;  // of the file's lock file
  Descriptor file_;
  Bytes text_;
  bool created_ = false;
  char szPath_[PATH_MAX] = {};  // where the file really is
};

// Composes the new content of a file from its old text; a failure is remembered by the bytes that are new. Refers to a
// function object that outlives it.
class Composer {
 public:
  template <class Compose>
  Composer(const Compose& compose)  // NOLINT(google-explicit-constructor)
      : object_(&compose), call_([](const void* object, std::string_view text, Revision& revision) {
          (*static_cast<const Compose*>(object))(text, revision);
        }) {}

  void operator()(std::string_view text, Revision& revision) const { call_(object_, text, revision); }

 private:
  const void* object_;
  void (*call_)(const void* object, std::string_view text, Revision& revision);
};

// Changes a file in one go.
Status EditFile(const char* szPath, mode_t mode, Composer compose);

#endif  // MERO_PLATFORM_FILE_EDIT_H
