// Reading and changing settings files.
#include "platform/core/settings_file.h"

#include "platform/base/failure.h"
#include "platform/base/file_read.h"

namespace {

int ReportUnread(const char* szPath, int error) {
  if (error == ENOENT) return PLIBCErrSet(ERR_FILE_NOT_FOUND), 0;
  return FAIL(error, "Failed to read %s", szPath), -1;
}

int ReportUnlessWritten(const char* szPath, Status written) {
  if (written.ok()) return 1;
  return FAIL(written.error(), "Failed to write %s", szPath), -1;
}

}  // namespace

int ReadSettings(const char* szPath, Bytes& text) {
  Result<Bytes> file = ReadFile(szPath);
  if (!file.ok()) return ReportUnread(szPath, file.error());
  text = std::move(*file);
  return 1;
}

int ChangeSettings(const char* szPath, mode_t mode, Composer compose) {
  return ReportUnlessWritten(szPath, EditFile(szPath, mode, compose));
}

int ShortenSettings(const char* szPath, MERO_ERROR absent, Composer compose) {
  Result<FileEdit> edit = FileEdit::Open(szPath, 0);
  if (!edit.ok()) return ReportUnread(szPath, edit.error());
  Revision revision;
  compose(edit->text(), revision);
  if (revision.size() == edit->text().size()) return PLIBCErrSet(absent), 0;
  return ReportUnlessWritten(szPath, edit->Commit(revision));
}
