say 'Programs: a clean child, a time limit, an exact exit status'
expect 1 tavoctl proc run --timeout 1 /bin/sleep 10
run tavoctl proc find sh
