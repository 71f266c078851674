# Completion of tavoctl for fish: the program itself says what may stand at a place; beside that, file names.
complete -c tavoctl -a '(tavoctl --complete (commandline -opc)[2..] (commandline -ct) 2>/dev/null)'
