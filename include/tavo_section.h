/*
 * Settings files with sections.
 *
 * A section header is a line that begins with "[" and whose last character other than white space is "]". It heads the
 * section whose name is between the brackets, byte for byte; only white space may follow the "]". The body is every
 * line up to the next one that begins with "[" or the end of the file: settings as in tavo_file.h, split at the first
 * "=", both sides trimmed. A name must not hold "]", a line feed or a carriage return; ERR_BAD_PARAMETERS.
 *
 * Pairs are written in the hash's slot order, not in the order of insertion. tavo_file.h describes what keys, values
 * and line formats (NULL: "%s=%s\n") may hold, and how a rewrite works and fails; here a read error is ERR_READ_FAILED.
 * Nothing is locked.
 */
#ifndef TAVO_SECTION_H
#define TAVO_SECTION_H

#include "tavo_error.h"
#include "tavo_hash.h"
#include "tavo_list.h"

#include <stdio.h>

TAVO_BEGIN_DECLS

/* Sets every pair of the first section szSection into the caller's hash *ppshHash, which may move; of a repeated key
 * the last line counts. A missing section is not an error. Beware: reading ends at any line that begins with "[", but
 * for rewriting only a real header ends a section.
 * Returns the number of pairs in the hash, or -1 (the hash may hold a part of the pairs) with
 *   ERR_BAD_PARAMETERS  an argument or *ppshHash is NULL
 *   ERR_OPEN_FAILED     the file cannot be opened or is not a regular file
 *   ERR_READ_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int TLIBFileGetSection(const char *szPath, const char *szSection, TLIBSZHASH **ppshHash);

/* Rewrites every section szSection. With flags 1 its header and body are replaced by the header of szNewName (NULL: the
 * name stays) and the pairs of pshPairs; with flags 0 they are removed. Comment lines of the body stay, after the new
 * pairs. A missing section is not added.
 * Returns 1, 0 with ERR_KEY_NOT_FOUND when no such section was found (the file is still rewritten), or -1 with
 * ERR_BAD_PARAMETERS (szPath, szSection or pshPairs is NULL, or a text cannot be written) or a code of a rewrite.
 * Errors: ERR_OPEN_FAILED, ERR_STAT_FAILED, ERR_WRITE_FAILED, ERR_RENAME_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int ErrTLIBFileSetSection(const char *szPath, const char *szSection, const char *szNewName,
                                   const TLIBSZHASH *pshPairs, int flags, const char *szFormat);

/* Pushes the name of every section, in file order, onto the caller's list *ppslNames, which may move.
 * Returns the number of items of the list, those that it held before included, or -1 (the list may hold a part of the
 * names): with no code for a header line of more than 1023 bytes, else with ERR_BAD_PARAMETERS (an argument or
 * *ppslNames is NULL), ERR_OPEN_FAILED, ERR_READ_FAILED or ERR_OUT_OF_MEMORY. */
TAVO_API int TLIBFileEnumSection(const char *szPath, TLIBSZLIST **ppslNames);

/* Appends a section in place, even if one of that name exists. A file that does not exist is created.
 * Returns 0, or -1 with the old text in place and
 *   ERR_BAD_PARAMETERS  szPath, szSection or pshPairs is NULL, or a text cannot be written
 *   ERR_OPEN_FAILED     the file cannot be opened for writing, or created, or is not a regular file; or it is one that
 *                       TLIBFileAppendKey refuses
 *   ERR_WRITE_FAILED    the text could not be written and synced
 *   ERR_OUT_OF_MEMORY */
TAVO_API int ErrTLIBFileAddSection(const char *szPath, const char *szSection, const TLIBSZHASH *pshPairs,
                                   const char *szFormat);

/* Removes every section szSection: its header and body. The comment lines of the body stay and so belong to the section
 * before it.
 * Returns 1, 0 with ERR_KEY_NOT_FOUND when no such section was found (the file is still rewritten), or -1 with
 * ERR_BAD_PARAMETERS (a NULL argument) or a code of a rewrite.
 * Errors: ERR_OPEN_FAILED, ERR_STAT_FAILED, ERR_WRITE_FAILED, ERR_RENAME_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int ErrTLIBFileRemoveSection(const char *szPath, const char *szSection);

/* Returns 1 when the line of length bytes is a section header, else 0; with ERR_BAD_PARAMETERS when szLine is NULL. */
TAVO_API int TLIBIFileIsSection(const char *szLine, int length);

/* Returns 1 when the line of length bytes heads the section szSection, 0 when not, -1 with ERR_BAD_PARAMETERS when
 * szLine or szSection is NULL. */
TAVO_API int TLIBIFileMatchSection(const char *szLine, int length, const char *szSection);

/* The rewrite that Set and Remove share: as ErrTLIBFileSetSection, but pshPairs may be NULL when flags is 0.
 * Errors: ERR_OPEN_FAILED, ERR_STAT_FAILED, ERR_WRITE_FAILED, ERR_RENAME_FAILED, ERR_OUT_OF_MEMORY */
TAVO_API int TLIBIFileModifySection(const char *szPath, const char *szSection, const char *szNewName,
                                    const TLIBSZHASH *pshPairs, int flags, const char *szFormat);

/* Writes "[szSection]", unless szSection is NULL, and the pairs of the hash to an open stream, which stays open.
 * Returns 0, or -1 with
 *   ERR_BAD_PARAMETERS  pfStream or pshPairs is NULL, or the format, the name or a pair cannot be written; nothing was
 *                       written
 *   ERR_WRITE_FAILED    the stream took only a part
 *   ERR_OUT_OF_MEMORY */
TAVO_API int ErrTLIBIFileHash2File(FILE *pfStream, const char *szSection, const TLIBSZHASH *pshPairs,
                                   const char *szFormat);

/* Returns 0 when a section can be written with the line format: NULL, or "%s", "=", "%s" and a newline in this order,
 * among other text without any other "%" than "%%". Otherwise returns -1 with ERR_BAD_PARAMETERS. */
TAVO_API int TLIBIFileCheckFormat(const char *szFormat);

TAVO_END_DECLS

#endif
