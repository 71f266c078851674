// The steps that restore parts of the network, as data: they are written to a file that a later process may have to
// execute.
#ifndef TAVO_NETWORK_DETAIL_UNDO_STEP_H
#define TAVO_NETWORK_DETAIL_UNDO_STEP_H

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace tavo {

struct UndoStep {
    enum Kind : char {
        file = 'f',     // `target` has the text `value`, and the mode `more` in octal
        no_file = 'F',  // `target` is not there
        only_files =
            'o',        // of the folder `target`, files that begin with `more` are those listed in `value`, one a line
        setting = 's',  // the key `more` of `target` has that value
        no_setting = 'S',     // `target` has no such key
        only_settings = 'O',  // keys of `target` that end with `more` are those listed in `value`, one a line
        host_name = 'h',      // the kernel's name is `target`
        command = 'c',        // `target` is run
        address = 'a',        // the same; a failure is reported
        route = 'r',          // the same; `value` is the route, as RouteText writes it
        end_clients =
            'e',       // DHCP clients of the interface `target` end, except the process `value` that began at `more`
        wake = 'w',    // the card `target` wakes the appliance on the packets `value`, a number of WAKE_ bits
        client = 'd',  // the interface `target` has a DHCP client
        // Of a checkpoint of the whole network:
        structure =
            'n',     // the interfaces are those of `value`; else the network is stopped, and started with the old files
        card = 'k',  // the steps up to the next such one are only needed where `target` is not as `value` has it
    };

    Kind kind;
    std::string target;
    std::string value;
    std::string more;
    bool after_death = false;  // only needed when the progress of the change is not known

    bool IsOfFiles() const
    {
        return kind == file || kind == no_file || kind == only_files || kind == setting || kind == no_setting ||
               kind == only_settings;
    }
    bool operator==(const UndoStep &) const = default;
};

std::string UndoText(const std::vector<UndoStep> &steps);

// Empty when the text is not all of what UndoText wrote.
std::optional<std::vector<UndoStep>> ParseUndo(std::string_view text);

}  // namespace tavo

#endif
