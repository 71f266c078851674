say 'What happens is told as it happens: a line for each event, no disk is woken'
printf '$ tavoctl watch &\n'
tavoctl watch >/tmp/events &
watching=$!
sleep 1
run ip addr add 127.0.0.77/8 dev lo
run ip addr del 127.0.0.77/8 dev lo
sleep 1
kill $watching
wait $watching || true
cat /tmp/events
[ -s /tmp/events ]
rm /tmp/events
