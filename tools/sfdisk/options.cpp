// The command line: exactly the options that the appliance uses. A word that is not known is refused before the disk is
// looked at: another tool of this name knows some of the letters with other meanings.
#include "options.h"

#include <charconv>

namespace sfdisk {

const char *const kHelp =
    "usage: sfdisk -l [-uS] [-N<number>] DISK\n"
    "       sfdisk -N<number> [-uS] {-j<gap>|-o<start>} -z<count> -t<type> [-F] [-D] [-q] [-f] [--no-reread] DISK\n"
    "       sfdisk -M1 [-q] [-f] [--no-reread] DISK\n"
    "\n"
    "Lists or changes the partition table of a disk, or of a file that is the image of one: an MS-DOS table, or a "
    "GUID\n"
    "partition table on a disk of more than 2^32 sectors. All numbers are sectors of 512 bytes.\n"
    "\n"
    "  -l            list: device, start, end, count, type in hexadecimal and its name, one line a partition;\n"
    "                exit status 1 when the partition asked for with -N is not there\n"
    "  -uS           count in sectors (nothing else is known)\n"
    "  -N<number>    the partition: 1 to 4 to create; those from 5 on can be listed and emptied\n"
    "  -j<gap>       sectors to leave free after the end of the previous partition, or from the start of the disk\n"
    "  -o<start>     the sector at which the partition starts\n"
    "  -z<count>     its size; -1 for the rest of the disk, up to what a table can address; 0 empties the entry\n"
    "  -t<type>      its type in hexadecimal; 0 with -z0\n"
    "  -M1           write an empty table, of the kind that the size of the disk asks for; the others keep its kind\n"
    "  -F, -D        start at the very sector: no rounding to a cylinder or a track (there never is any)\n"
    "  -f            even when the disk is in use (a file system, an array)\n"
    "  -q            no remarks, only errors\n"
    "  --no-reread   do not let the kernel read the table again\n"
    "\n"
    "Exit status: 0 done, 1 failed or not there, 2 not understood.\n";

namespace {

template <class Number>
bool ParseNumber(std::string_view text, Number &number, int base = 10)
{
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number, base);
    return error == std::errc{} && end == text.data() + text.size();
}

// The given options, before their combination is checked.
struct Given {
    Options options;
    bool list = false;
    bool label = false;
    bool size = false;
    bool type = false;
    bool change_only = false;  // -F, -D: make sense with -z alone
};

bool TakeOption(std::string_view word, Given &given)
{
    Options &options = given.options;
    if (word == "-l")
        return given.list = true;
    if (word == "-uS")
        return true;
    if (word == "-q")
        return options.quiet = true;
    if (word == "-f")
        return options.force = true;
    if (word == "-M1")
        return given.label = true;
    if (word == "-F" || word == "-D")
        return given.change_only = true;
    if (word == "--no-reread") {
        options.reread = false;
        return true;
    }
    if (word == "-z-1") {
        options.count.reset();
        return given.size = true;
    }
    const std::string_view value = word.size() > 2 ? word.substr(2) : "";
    uint64_t number = 0;
    if (word.starts_with("-N"))
        return ParseNumber(value, options.number) && options.number >= 1 && options.number <= 255;
    if (word.starts_with("-t"))
        return (given.type = ParseNumber(value, options.type, 16));
    if (!ParseNumber(value, number))
        return false;
    if (word.starts_with("-j"))
        options.gap = number;
    else if (word.starts_with("-o"))
        options.start = number;
    else if (word.starts_with("-z"))
        options.count = number, given.size = true;
    else
        return false;
    return true;
}

// Which action the options make together; empty when they do not fit.
std::optional<Action> Judge(const Given &given)
{
    const Options &options = given.options;
    const bool places = options.gap || options.start || given.size || given.type || given.change_only;
    if (given.list)
        return given.label || places ? std::nullopt : std::optional(Action::list);
    if (given.label)
        return options.number || places ? std::nullopt : std::optional(Action::label);
    if (!options.number || !given.size || !given.type || (options.gap && options.start))
        return std::nullopt;
    if (options.count && *options.count == 0)
        return options.type || options.start.value_or(0) ? std::nullopt : std::optional(Action::clear);
    return options.type && (options.gap || options.start) ? std::optional(Action::create) : std::nullopt;
}

}  // namespace

std::optional<Options> ParseOptions(const std::vector<std::string_view> &words, std::string &complaint)
{
    Given given;
    for (const std::string_view word : words) {
        if (word == "--help")
            return Options{};
        if (word.starts_with('-')) {
            if (!TakeOption(word, given)) {
                complaint = "option '" + std::string(word) + "' is not known";
                return std::nullopt;
            }
        } else if (word.empty() || !given.options.path.empty()) {
            complaint = "exactly one disk, please";
            return std::nullopt;
        } else {
            given.options.path = word;
        }
    }
    const std::optional<Action> action = Judge(given);
    if (!action || given.options.path.empty()) {
        complaint = given.options.path.empty() ? "no disk is given" : "these options do not go together";
        return std::nullopt;
    }
    given.options.action = *action;
    return given.options;
}

}  // namespace sfdisk
