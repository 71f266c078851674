/*
 * String helpers: tokens, trimming, colon encoding, and UTF-8 without regard to case.
 *
 * All work on memory that the caller owns; nothing is allocated for the caller. A code is recorded only for failures
 * that name one.
 */
#ifndef TAVO_STR_H
#define TAVO_STR_H

#include "tavo_error.h"

TAVO_BEGIN_DECLS

/* Cuts the next token off the text at *ppCursor: overwrites the next byte of szDelimiters with a NUL and moves
 * *ppCursor after it, or to NULL at the end of the text. Empty tokens are skipped.
 * Returns the token; NULL when the text is used up or an argument is NULL. */
TAVO_API char *TLIBStrTok(char **ppCursor, const char *szDelimiters);
TAVO_API char *TLIBIStrTok(char **ppCursor, const char *szDelimiters);

/* As TLIBStrTok, but empty tokens are returned too: "a::b" split at ":" is "a", "" and "b". */
TAVO_API char *TLIBStrSep(char **ppCursor, const char *szDelimiters);

/* Copies szSrc to szDst without the white space at both ends (tab, line feed, carriage return, space), and then without
 * one pair of enclosing double quotes. szDst NULL or szSrc itself: in place; any other szDst must have room for the
 * result.
 * Returns the length of the result in bytes, without its NUL. -1 with
 *   ERR_BAD_PARAMETERS  szSrc is NULL, or szDst overlaps it elsewhere than at its beginning; nothing was written */
TAVO_API int TLIBStrTrimSpace(char *szSrc, char *szDst);

/*
 * Colon encoding makes any text fit in a field of a line of colon-separated fields. A colon is written as "%3A", a line
 * feed as "%0A", a carriage return as "%0D"; a percent sign as "%25" if "25", "3A", "0A" or "0D" follows it, otherwise
 * unchanged. Every other byte stays unchanged, so text without a colon mostly looks as it was typed. Decoding restores
 * the same bytes for every string. Text that was never encoded can be decoded too; only these four sequences change.
 *
 * Both return the length of the result in bytes, with its NUL, or -1 with
 *   ERR_BAD_PARAMETERS     szSrc is NULL, cbDst is negative, szDst is NULL while cbDst is not 0, or they overlap
 *   ERR_NOT_ENOUGH_MEMORY  szDst is too small; nothing was written
 * szDst NULL with cbDst 0 asks for that length. Decoding may be done in place (szDst is szSrc).
 */
TAVO_API int TLIBStrEncodeColon(const char *szSrc, char *szDst, int cbDst);
TAVO_API int TLIBStrDecodeColon(const char *szSrc, char *szDst, int cbDst);

/* Copies the UTF-8 text szSrc in upper case, by language-independent rules, to szDst of cbDst bytes. The
 * result can be longer than the source. szDst may be szSrc; szDst NULL with cbDst 0 asks for the length.
 * Returns the length of the result with its NUL, or -1, with nothing written and
 *   ERR_BAD_PARAMETERS     szSrc is NULL, is not UTF-8 or is longer than 512 MiB, cbDst is negative, or szDst is NULL
 *                          while cbDst is not 0; or szSrc is not ASCII and the library's extras cannot be loaded
 *   ERR_NOT_ENOUGH_MEMORY  szDst is too small
 *   ERR_OUT_OF_MEMORY */
TAVO_API int TLIBUnicodeUTF8StrUpper(const char *szSrc, char *szDst, int cbDst);

/* Returns the number of characters (code points) of the UTF-8 text sz. -1 with ERR_BAD_PARAMETERS: sz is NULL or is not
 * UTF-8. */
TAVO_API int TLIBUnicodeUTF8StrCountChar(const char *sz);

/* Compares two UTF-8 texts without regard to case, by language-independent rules ("ß" equals "SS").
 * Returns -1, 0 or 1 as szLeft is less than, equal to or greater than szRight. -2 with ERR_BAD_PARAMETERS: an argument
 * is NULL, one of them is not UTF-8 (anywhere in the text), or one is not ASCII and the library's extras cannot be
 * loaded. */
TAVO_API int TLIBUnicodeUTF8StrCaseCmp(const char *szLeft, const char *szRight);

TAVO_END_DECLS

#endif
