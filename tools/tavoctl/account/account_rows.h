// Lists of accounts in files: comma-separated values, or JSON.
#ifndef TAVOCTL_ACCOUNT_ROWS_H
#define TAVOCTL_ACCOUNT_ROWS_H

#include <map>
#include <string>
#include <string_view>
#include <vector>

namespace tavoctl {

struct AccountRow {
    int number;                                 // line of the file, or element of the array, from 1
    std::map<std::string, std::string> fields;  // only the fields that the row has

    const std::string *Find(const std::string &column) const;
    std::string Where() const;  // "row 3"
};

// The text as rows of these columns, at least "name"; JSON is an array of objects. Throws a Failure for anything else.
std::vector<AccountRow> ParseAccountRows(std::string_view text, const std::vector<std::string> &columns);

}  // namespace tavoctl

#endif
