// How an exported function rewrites a file and reports a failure under its own module name.
#ifndef TAVO_CORE_DETAIL_REWRITE_REPORT_H
#define TAVO_CORE_DETAIL_REWRITE_REPORT_H

#include "core/detail/fault.h"
#include "core/detail/file_rewrite.h"
#include "core/detail/function_ref.h"

#include <optional>
#include <string>
#include <string_view>

namespace tavo {

// The rename has happened, so a failed directory sync is only logged.
void LogUnsyncedDirectory(const FileRewrite &rewrite, Where where = Where());

// 0, or -1 with the code set.
int ReplaceOrFail(FileRewrite &rewrite, std::string_view text, Where where = Where());

// Opens a file to be rewritten and reads it. 0, or -1 with the code set.
int ReadOrFail(FileRewrite &rewrite, const char *path, std::string &text, Where where = Where());

enum class Missing { fail, create };

// Takes the old text and returns the new one, or nothing when the line or key to be edited is not there.
using TextEdit = FunctionRef<std::optional<std::string>(std::string_view text)>;

// Rewrites a file by an edit of its whole text. 1, 0 with ERR_KEY_NOT_FOUND, -1 with another code.
int RewriteText(const char *path, Missing missing, TextEdit edit, Where where = Where()) noexcept;

// The same for a line from the caller, with or without its newline.
using LineEdit = FunctionRef<std::optional<std::string>(std::string_view text, std::string_view line)>;
int RewriteWithLine(const char *path, const char *argument, LineEdit edit, Where where = Where()) noexcept;

}  // namespace tavo

#endif
