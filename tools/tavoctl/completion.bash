# Completion of tavoctl for bash: the program itself says what may stand at a place; where it says nothing, file names.
_tavoctl() {
    local IFS=$'\n'
    COMPREPLY=($(tavoctl --complete "${COMP_WORDS[@]:1:COMP_CWORD}" 2>/dev/null))
}
complete -o default -F _tavoctl tavoctl
