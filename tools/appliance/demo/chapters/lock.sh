say 'Locks: processes that change the same files wait for each other'
tavoctl lock run tavoinfo -- sleep 2 &
sleep 0.3
expect 4 tavoctl lock run --timeout 0 tavoinfo -- echo 'never runs'
run tavoctl lock run --timeout 5 tavoinfo -- echo 'runs when the first has let go'
wait
