# Completion of tavoctl for fish: the program itself says what may stand at a place; where it says nothing, file names.
function __tavoctl_candidates
    set -l found (tavoctl --complete (commandline -opc)[2..] (commandline -ct) 2>/dev/null)
    if set -q found[1]
        printf '%s\n' $found
    else
        __fish_complete_path (commandline -ct)
    end
end
complete -c tavoctl -f -a '(__tavoctl_candidates)'
