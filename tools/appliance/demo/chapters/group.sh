say 'Groups, with their members'
run tavoctl group add family --description 'The family' --members anna,bertil
run tavoctl group modify family --leave bertil
run tavoctl group show family
run tavoctl group check
