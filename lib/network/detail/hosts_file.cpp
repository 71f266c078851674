// /etc/hosts: two lines are the appliance's, the rest is the administrator's.
#include "network/detail/hosts_file.h"

#include "tavo_error.h"

#include "core/detail/file_rewrite.h"
#include "core/detail/text_fields.h"
#include "network/detail/interface_file.h"
#include "network/detail/kernel_interface.h"

#include <algorithm>
#include <cerrno>

#include <unistd.h>

namespace tavo {
namespace {

// The address of the host name while no card has one: local programs still look the name up.
constexpr const char *kNoAddress = "127.0.1.1";

// A line that says nothing but what the two managed lines say.
bool IsManaged(std::string_view line, std::string_view old_name, std::string_view new_name)
{
    const auto field = SplitFields(line.substr(0, line.find('#')));
    if (field.size() != 2)
        return false;
    return (field[0] == "127.0.0.1" && field[1] == "localhost") || field[1] == new_name ||
           (!old_name.empty() && field[1] == old_name);
}

// Empty when the kernel does not say: an address that is only not seen just now must not be taken from the name.
std::optional<std::string> OwnAddress()
{
    const auto interfaces = WiredInterfaces();
    if (!interfaces)
        return std::nullopt;
    for (const std::string &interface : *interfaces) {
        if (const auto found = AddressOf(interface))
            return found->address.Text();
        if (errno != EADDRNOTAVAIL && errno != ENODEV)
            return std::nullopt;
    }
    return kNoAddress;
}

// One word of printable characters: the file is other programs' syntax.
bool IsOneWord(std::string_view name)
{
    return !name.empty() &&
           std::all_of(name.begin(), name.end(), [](char byte) { return byte > ' ' && byte < 0x7F && byte != '#'; });
}

std::optional<std::string> NewText(std::string_view text, std::string_view old_name)
{
    const auto name = OwnHostName();
    const auto address = OwnAddress();
    if (!name || !address)
        return std::nullopt;
    return name->empty() ? std::string(text) : HostsWithName(text, old_name, *name, *address);
}

}  // namespace

std::string HostsWithName(std::string_view old_text, std::string_view old_name, std::string_view new_name,
                          std::string_view address)
{
    std::string text = "127.0.0.1\tlocalhost\n";
    if (!address.empty())
        text.append(address).append("\t").append(new_name).append("\n");
    while (!old_text.empty()) {
        const std::string_view line = TakeLine(old_text);
        if (!IsManaged(line, old_name, new_name))
            text.append(line).append("\n");
    }
    return text;
}

std::optional<std::string> OwnHostName()
{
    const auto stored = TryReadSetting(kNetworkFile, "HOSTNAME");
    if (!stored || IsOneWord(*stored))
        return stored;
    char name[256] = "";
    ::gethostname(name, sizeof name - 1);
    return IsOneWord(name) ? name : "";
}

int UpdateHosts(std::string_view old_name)
{
    FileRewrite rewrite;
    std::string text;
    if (const int code = rewrite.Open(kHostsFile); code != 0 && !rewrite.IsMissing())
        return code;
    if (!rewrite.IsMissing() && !rewrite.Read(text))
        return ERR_READ_FAILED;
    const auto edited = NewText(text, old_name);
    if (!edited)
        return ERR_READ_FAILED;
    return *edited == text ? Code() : rewrite.Replace(*edited, 0644);
}

bool AreHostsTrue()
{
    const auto text = ReadKernelFile(kHostsFile);
    if (!text)
        return errno != ENOENT;
    const auto edited = NewText(*text, {});
    return !edited || *edited == *text;
}

}  // namespace tavo
