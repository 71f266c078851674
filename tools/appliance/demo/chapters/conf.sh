say 'Settings: the system settings file, rewritten safely, comments and order kept'
run tavoctl conf list
run tavoctl conf set --dry-run runsamba yes
run tavoctl conf set runsamba yes
run tavoctl conf get runsamba
run tavoctl conf get --json runsamba
expect 3 tavoctl conf get no_such_key
