// Names that a caller may pass to make more happen than the caller is allowed to.
#ifndef TESTS_SUPPORT_HOSTILE_NAMES_H
#define TESTS_SUPPORT_HOSTILE_NAMES_H

#include <string>
#include <vector>

namespace test {

// The file that each of them would create if it were executed as part of a command.
inline const char *const kCanary = "/tmp/canary";

// 200 and more; none is the name of a device, with or without "/dev/" before it.
inline std::vector<std::string> HostileNames()
{
    // "@" is a command that creates the file.
    std::vector<std::string> tails = {";@",           "; @ #",    "|@",          "||@",
                                      "&@",           "&&@",      "$(@)",        "`@`",
                                      "\n@",          "\n@\n",    "\r@",         "<(@)",
                                      "'@'",          "';@;'",    "\";@;\"",     "\\\n@",
                                      "'$(@)'",       "\"$(@)\"", "${IFS}@",     " @",
                                      "\t@",          "!@",       "*",           "?",
                                      "[a-z]",        "{a,b}",    "~root",       "\xC3\xA4",
                                      "\xE2\x80\xAE", "\xFF\xFE", "\x1B[2J",     "/../../etc/passwd",
                                      "/..",          "#",        "%n%n%n%n \n", " --zero-superblock",
                                      "\x7F"};
    tails.insert(tails.end(), {std::string(4096, 'a'), std::string(4096, ';'), std::string(">") + kCanary});
    for (std::string &tail : tails) {
        if (const size_t at = tail.find('@'); at != tail.npos)
            tail.replace(at, 1, std::string("touch ") + kCanary);
    }
    std::vector<std::string> names = {
        "",      " ",     "\n",      ".",       "..", "-", "--help", "-rf", "../../etc/passwd", "/etc/shadow ",
        "$HOME", "/dev/", "/dev/..", "/dev/./", "//"};
    for (const std::string &tail : tails) {
        for (const char *start : {"sda", "/dev/sda", "/dev/", "-", "../"})
            names.push_back(start + tail);
    }
    return names;
}

}  // namespace test

#endif
