/*
 * Settings files: lines of key and value.
 *
 * One setting per line. A line that begins with "#" or ";" is a comment; a blank line or one without "=" sets nothing.
 * The key is the text before the first "=" (leading "=" signs are skipped: "=x" has the key x and no value), the
 * value is the rest of the line. White space (tab, line feed, carriage return, space) is removed from both ends of
 * each, and then one pair of enclosing double quotes; so the line "k"=v sets the key k too. Keys match byte
 * for byte. A line may have any length; a NUL byte ends a value, and lines that are only copied keep it.
 *
 * Writers refuse text that could not be read back with ERR_BAD_PARAMETERS: a line feed or carriage return in a key or a
 * value, and a key that is empty, holds "=", begins with "#", ";" or "[", or has white space or a pair of double quotes
 * around it. A caller's own line format (NULL: "%s=%s\n") takes the key and then the value: exactly two "%s", and "%%"
 * for a percent sign; any other "%" is refused with ERR_BAD_PARAMETERS. A format should end with a newline.
 *
 * Rewriting is safe: the new text goes to a temporary file beside the target (its name and six random characters
 * after a dot), is synced to disk, gets the owner, group, permission bits and extended attributes of the old file, and
 * is renamed over it. A crash leaves the old file or the new one. A symbolic link is followed and stays a link, except
 * in a directory that everybody may write to (/tmp), where writers refuse it with ERR_OPEN_FAILED; a hard link is cut.
 * After a failure the old file is unchanged and the temporary file removed. A new file has mode 0644, whatever the
 * umask. The codes of a rewrite are
 *   ERR_OPEN_FAILED     the file cannot be opened or is not a regular file, or the temporary file cannot be created
 *   ERR_STAT_FAILED     the state of the open file cannot be read
 *   ERR_WRITE_FAILED    reading the old text or writing the new one failed (a full disk)
 *   ERR_RENAME_FAILED   the new file could not take the old one's place
 *   ERR_OUT_OF_MEMORY   no memory
 *
 * Nothing is locked and nothing is cached: of two simultaneous rewrites one is lost, unless the callers hold the
 * file's lock (tavo_lock.h). Paths are NUL-terminated; FIFOs, devices and directories are refused without waiting.
 */
#ifndef TAVO_FILE_H
#define TAVO_FILE_H

#include "tavo_error.h"
#include "tavo_hash.h"
#include "tavo_list.h"

#include <stdio.h>

TAVO_BEGIN_DECLS

/* Copies the value of szKey, with its NUL, to szBuf of cbBuf bytes. A NULL szBuf with cbBuf 0 asks for the length only.
 * flags 0: the first line that sets the key counts; flags 1: the last one.
 * Returns the length of the value with its NUL (1 for an empty value), 0 with
 *   ERR_KEY_NOT_FOUND      no line sets the key
 * or -1 with szBuf untouched and
 *   ERR_BAD_PARAMETERS     szPath or szKey is NULL, flags is negative, or szBuf is NULL and cbBuf is not 0
 *   ERR_OPEN_FAILED        the file cannot be opened or is not a regular file
 *   ERR_NOT_ENOUGH_MEMORY  the value needs more than cbBuf bytes
 *   ERR_READ_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int TLIBFileGetKeyValue(const char *szPath, const char *szKey, char *szBuf, int cbBuf, int flags);

/* Sets szKey to szValue by a safe rewrite: the first line of the key is replaced, later ones are dropped, and a key
 * that is not there is appended. A file that does not exist is created with that one line.
 * Returns 1, or -1 with ERR_BAD_PARAMETERS (a NULL argument other than szFormat, or see above) or a code of a rewrite.
 * Errors: ERR_OPEN_FAILED, ERR_STAT_FAILED, ERR_WRITE_FAILED, ERR_RENAME_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int TLIBFileSetKeyValue(const char *szPath, const char *szKey, const char *szValue, const char *szFormat);

/* Appends szKey in place, without a rewrite, unless a line sets it already. A file that does not exist is created.
 * Returns 1, 0 with
 *   ERR_KEY_EXISTS      a line sets the key; nothing is written
 * or -1 with the old text in place and
 *   ERR_BAD_PARAMETERS  a NULL argument other than szFormat, a directory, or see above
 *   ERR_OPEN_FAILED     the file cannot be opened for writing, or created; or it is, in a directory that everybody may
 *                       write to, a link, another user's file, or one with a second name
 *   ERR_WRITE_FAILED    the line could not be written and synced
 *   ERR_READ_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int TLIBFileAppendKey(const char *szPath, const char *szKey, const char *szValue, const char *szFormat);

/* Removes every line of szKey by a safe rewrite.
 * Returns 1, 0 with ERR_KEY_NOT_FOUND and the file untouched, or -1 with ERR_BAD_PARAMETERS (a NULL argument) or a code
 * of a rewrite.
 * Errors: ERR_OPEN_FAILED, ERR_STAT_FAILED, ERR_WRITE_FAILED, ERR_RENAME_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int TLIBFileRemoveKey(const char *szPath, const char *szKey);

/* Reads many values into the caller's hash *ppshHash, which may move. A line is split at any byte of szSep ("=", or
 * " \t"): its first token is the key, the rest of the line is the value; comments and lines without one of the two are
 * skipped. With pslKeys NULL or empty every pair is set, so that of a repeated key the last line counts; otherwise only
 * the wanted keys are, and the first line counts.
 * Returns the number of pairs in the hash, or -1 (the hash may hold a part of the pairs) with
 *   ERR_BAD_PARAMETERS  szPath, ppshHash, *ppshHash or szSep is NULL
 *   ERR_OPEN_FAILED     the file cannot be opened or is not a regular file
 *   ERR_READ_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int TLIBFileGetKeys(const char *szPath, const TLIBSZLIST *pslKeys, TLIBSZHASH **ppshHash, const char *szSep);

/* Sets every pair of pshPairs in one safe rewrite: the first line of each key is replaced, its later ones are dropped,
 * and the keys that are not there are appended in the hash's slot order. A file that does not exist is created. The
 * hash is not changed. Returns 1, or -1 with ERR_BAD_PARAMETERS (szPath or pshPairs is NULL, or see above) or a code of
 * a rewrite.
 * Errors: ERR_OPEN_FAILED, ERR_STAT_FAILED, ERR_WRITE_FAILED, ERR_RENAME_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int TLIBFileSetKeys(const char *szPath, const TLIBSZHASH *pshPairs, const char *szFormat);

/*
 * Whole lines. Lines are numbered from 1 and read without their newline. A line argument may end in a newline; one
 * inside is refused with ERR_BAD_PARAMETERS.
 */

/* Copies a line, with a NUL, to szBuf of cbBuf bytes. A NULL szBuf with cbBuf 0 asks for the length only. The ByKey
 * form takes the first line that sets szKey.
 * Both return the length with the NUL, 0 with
 *   ERR_KEY_NOT_FOUND      no such line
 * or -1 with szBuf untouched and
 *   ERR_BAD_PARAMETERS     szPath or szKey is NULL, lineNo is below 1, or szBuf is NULL and cbBuf is not 0
 *   ERR_OPEN_FAILED        the file cannot be opened or is not a regular file
 *   ERR_NOT_ENOUGH_MEMORY  the line needs more than cbBuf bytes
 *   ERR_READ_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int TLIBFileGetLine(const char *szPath, int lineNo, char *szBuf, int cbBuf);
TAVO_API int TLIBFileGetLineByKey(const char *szPath, const char *szKey, char *szBuf, int cbBuf);

/* Replaces a line by a safe rewrite.
 * Both return 1, 0 with ERR_KEY_NOT_FOUND (no such line) and the file untouched, or -1 with ERR_BAD_PARAMETERS (a NULL
 * argument, lineNo below 1, a newline inside szLine) or a code of a rewrite.
 * Errors: ERR_OPEN_FAILED, ERR_STAT_FAILED, ERR_WRITE_FAILED, ERR_RENAME_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int TLIBFileSetLine(const char *szPath, int lineNo, const char *szLine);
TAVO_API int TLIBFileSetLineByKey(const char *szPath, const char *szKey, const char *szLine);

/* Inserts a line before line lineNo (0: after the last one), or before the first line that sets szKey, by a safe
 * rewrite. Results as of TLIBFileSetLine; lineNo below 0 is ERR_BAD_PARAMETERS.
 * Errors: ERR_OPEN_FAILED, ERR_STAT_FAILED, ERR_WRITE_FAILED, ERR_RENAME_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int TLIBFileAddLine(const char *szPath, int lineNo, const char *szLine);
TAVO_API int TLIBFileAddLineByKey(const char *szPath, const char *szKey, const char *szLine);

/* The number of the first line that sets szKey.
 * Returns 0 with ERR_KEY_NOT_FOUND when none does, or -1 with ERR_BAD_PARAMETERS (a NULL argument), ERR_OPEN_FAILED,
 * ERR_READ_FAILED or ERR_OUT_OF_MEMORY. */
TAVO_API int TLIBFileMatchLineNo(const char *szPath, const char *szKey);

/* Pushes every line onto the caller's list *ppslLines, which may move; an empty line is an empty item.
 * Returns the number of items of the list, those that it held before included, or -1 (the list may hold a part of the
 * lines) with ERR_BAD_PARAMETERS (szPath, ppslLines or *ppslLines is NULL), ERR_OPEN_FAILED, ERR_READ_FAILED or
 * ERR_OUT_OF_MEMORY. */
TAVO_API int TLIBFileReadLines(const char *szPath, TLIBSZLIST **ppslLines);

/* Puts ";" in front of every line that sets szKey. The new text is written to /etc/skel/tempErrTLIBFileComment when
 * that is on the same file system and nothing else is there, otherwise to a temporary file like any other rewrite.
 * Returns 1, 0 with ERR_KEY_NOT_FOUND and the file untouched, or -1 with ERR_BAD_PARAMETERS (a NULL argument) or a code
 * of a rewrite.
 * Files: /etc/skel/tempErrTLIBFileComment (created and renamed)
 * Errors: ERR_OPEN_FAILED, ERR_STAT_FAILED, ERR_WRITE_FAILED, ERR_RENAME_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int TLIBFileComment(const char *szPath, const char *szKey);

/* Replaces every occurrence of szOld within a line by szNew, from left to right, by a safe rewrite.
 * Returns the number of replacements (0: the file is untouched), or -1 with ERR_BAD_PARAMETERS (a NULL argument, an
 * empty szOld, a newline in either text) or a code of a rewrite.
 * Errors: ERR_OPEN_FAILED, ERR_STAT_FAILED, ERR_WRITE_FAILED, ERR_RENAME_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int TLIBFileReplaceSubStr(const char *szPath, const char *szOld, const char *szNew);

/* Creates a file (mode 0600, whatever the umask) whose name is szTemplate with its last six characters, which must be
 * "XXXXXX", made unique; the name is written to szTemplate.
 * Returns a stream for writing that the caller closes (close-on-exec), or NULL with
 *   ERR_BAD_PARAMETERS  szTemplate is NULL
 *   ERR_OPEN_FAILED     the file or the stream cannot be created; no file is left */
TAVO_API FILE *TLIBFileTempFileOpen(char *szTemplate);

/* Writes szPrefix and "PID-COUNT" to szBuf of cbBuf bytes; COUNT begins at 0 in a process and rises by one
 * per call. Nothing is created, and others can guess the name, so create the file with O_EXCL. Returns 0, or -1 with
 * szBuf untouched and ERR_BAD_PARAMETERS (a NULL argument, a negative size, a name that does not fit). */
TAVO_API int TLIBFileITmpName(const char *szPrefix, char *szBuf, int cbBuf);

/* Creates an empty file (mode 0644, whatever the umask) unless the file exists; an existing file is left alone, its
 * times too.
 * Returns 0, or -1 with ERR_BAD_PARAMETERS (NULL) or ERR_OPEN_FAILED (cannot be created, is not a regular file, or is
 * one that TLIBFileAppendKey refuses). */
TAVO_API int TLIBFileTouch(const char *szPath);

/* Removes a leading UTF-8 byte-order mark by a safe rewrite.
 * Returns 1 when there was one, 0 when there was none (no code, the file is untouched), or -1 with ERR_BAD_PARAMETERS
 * (NULL) or a code of a rewrite.
 * Errors: ERR_OPEN_FAILED, ERR_STAT_FAILED, ERR_WRITE_FAILED, ERR_RENAME_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int TLIBFileUTF8BomStrip(const char *szPath);

/* Returns 1 when the first line that sets szKey sets it to szValue, byte for byte. Returns 0 when it sets another value
 * (no code), or with ERR_KEY_NOT_FOUND, ERR_BAD_PARAMETERS (a NULL argument), ERR_OPEN_FAILED, ERR_READ_FAILED or
 * ERR_OUT_OF_MEMORY. */
TAVO_API int BlTAVOFileCheckKeyValue(const char *szPath, const char *szKey, const char *szValue);

/* Returns 1 when the line sets szKey, else 0; with ERR_BAD_PARAMETERS when an argument is NULL. */
TAVO_API int TLIBILineKeyMatch(const char *szLine, const char *szKey);

/* Sets a key of /etc/tavoinfo.conf, the system settings file, as TLIBFileSetKeyValue does with the default format,
 * while it holds the lock of that file. Returns 1, or -1 with
 * ERR_LOCK_FAILED or a code of TLIBFileSetKeyValue.
 * Files: /etc/tavoinfo.conf (rewritten)
 * Locks: TAVO_LOCK_TAVOINFO (exclusive, at most 5 s)
 * Errors: ERR_OPEN_FAILED, ERR_STAT_FAILED, ERR_WRITE_FAILED, ERR_RENAME_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int TAVOINFOSetKeyValue(const char *szKey, const char *szValue);

TAVO_END_DECLS

#endif
