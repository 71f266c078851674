say 'Users: one batch changes every account file, and all of them agree afterwards'
echo 'Kasba-3-Lux' | run tavoctl user add anna --description 'Anna Berg' --mail anna@example.com
run tavoctl user add bert --unknown-password --expires 2037/01/31
run tavoctl user list
run tavoctl user show anna
expect 1 tavoctl user add anna --unknown-password
run tavoctl user rename bert bertil
run grep -E '^(anna|bertil):' /etc/passwd
run tavoctl user check
