#compdef tavoctl
# Completion of tavoctl for zsh: the program itself says what may stand at a place; where it says nothing, file names.
local -a candidates
candidates=(${(f)"$(tavoctl --complete "${(@)words[2,CURRENT]}" 2>/dev/null)"})
if (( $#candidates )); then
    compadd -a candidates
else
    _files
fi
