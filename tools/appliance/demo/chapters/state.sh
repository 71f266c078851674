say 'The state as a document: shown, compared, put on another box or back on this one'
run tavoctl conf set timezone Here
tavoctl state show >/tmp/box.json
printf '$ tavoctl state show >/tmp/box.json\n'
run tavoctl conf set timezone Elsewhere
expect 1 tavoctl state diff /tmp/box.json
run tavoctl state apply --only settings /tmp/box.json
run tavoctl conf get timezone
rm /tmp/box.json
