say 'Errors say what, where and why'
expect 1 tavoctl conf set --file /no/such/directory/file key value
run tavoctl error explain 0x0900
