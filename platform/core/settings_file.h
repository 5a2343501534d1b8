// Reading and changing settings files for the operations on them, with their error codes and reports.
#ifndef MERO_PLATFORM_SETTINGS_FILE_H
#define MERO_PLATFORM_SETTINGS_FILE_H

#include "platform.h"
#include "platform/base/bytes.h"
#include "platform/base/file_edit.h"

// Reads a file. 1; 0 when it is missing, which sets the error code; -1 after a report.
int ReadSettings(const char* szPath, Bytes& text);

// Changes a file, which is created with that mode when it is missing. 1; -1 after a report.
int ChangeSettings(const char* szPath, mode_t mode, Composer compose);

// Changes a file by leaving out parts of it. 1; 0 when it is missing or nothing was left out, which sets the error
// code, to `absent` in the second case; -1 after a report.
int ShortenSettings(const char* szPath, MERO_ERROR absent, Composer compose);

#endif  // MERO_PLATFORM_SETTINGS_FILE_H
