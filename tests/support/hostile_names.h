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
    const std::string touch = std::string("touch ") + kCanary;
    const std::vector<std::string> tails = {
        ";" + touch,
        "; " + touch + " #",
        "|" + touch,
        "||" + touch,
        "&" + touch,
        "&&" + touch,
        "$(" + touch + ")",
        "`" + touch + "`",
        "\n" + touch,
        "\n" + touch + "\n",
        "\r" + touch,
        ">" + std::string(kCanary),
        "<(" + touch + ")",
        "'" + touch + "'",
        "';" + touch + ";'",
        "\";" + touch + ";\"",
        "\\\n" + touch,
        "'$(" + touch + ")'",
        "\"$(" + touch + ")\"",
        "${IFS}" + touch,
        " " + touch,
        "\t" + touch,
        "*",
        "?",
        "[a-z]",
        "{a,b}",
        "~root",
        "\xC3\xA4",
        "\xE2\x80\xAE",
        "\xFF\xFE",
        "\x1B[2J",
        "/../../etc/passwd",
        "/..",
        "#",
        "!" + touch,
        "%n%n%n%n \n",
        std::string(4096, 'a'),
        std::string(4096, ';'),
        " --zero-superblock",
        "\x7F",
    };
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
