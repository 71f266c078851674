// Reads what "mdadm -E" says about a member's superblock, line by line.
#ifndef TAVO_STORAGE_DETAIL_MDADM_EXAMINE_H
#define TAVO_STORAGE_DETAIL_MDADM_EXAMINE_H

#include "tavo_raid.h"

#include <string>
#include <string_view>

namespace tavo {

enum class ExamineOutcome { good, bad_version, bad_role, bad_row };

// Adds a line, without its newline, to the record. An invalid text is stored in `wrong`; the reading ends there.
ExamineOutcome ReadExamineLine(std::string_view line, RAIDSUPERBLOCK &superblock, std::string &wrong);

// "99a1cb1e:1aaa3c52:49268cdc:b4e6580a", and nothing but.
bool IsArrayUuid(std::string_view text);

// Two of them, in whatever case.
bool IsSameArrayUuid(std::string_view left, std::string_view right);

}  // namespace tavo

#endif
