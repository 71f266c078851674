// The text of /etc/hosts: two lines are the appliance's, the rest is the administrator's.
#include "network/detail/hosts_file.h"

#include "core/detail/text_fields.h"

namespace tavo {
namespace {

// A line that says nothing but what the two managed lines say.
bool IsManaged(std::string_view line, std::string_view old_name, std::string_view new_name)
{
    const auto field = SplitFields(line.substr(0, line.find('#')));
    if (field.size() != 2)
        return false;
    return (field[0] == "127.0.0.1" && field[1] == "localhost") || field[1] == new_name ||
           (!old_name.empty() && field[1] == old_name);
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

}  // namespace tavo
