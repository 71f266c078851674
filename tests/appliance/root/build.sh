#!/usr/bin/env bash
# A root is built once for the same inputs and again when one of them changes, and contains what was added to it.
. "$(dirname "$0")/common.sh"

printf 'int main(int c, char **v) { return c == 2 && v[1][0] == 0x78 ? 21 : 1; }\n' >"$scratch/main.c"
cc -o "$scratch/probe" "$scratch/main.c"
new=$scratch/root
cp -a "$root/programs" "$scratch/programs" 2>/dev/null && mkdir "$new" && mv "$scratch/programs" "$new/"
make() { "$tools/build" --out "$new" --program "$scratch/probe:/usr/tavo/bin/probe" --file "$scratch/main.c:/etc/extra.conf"; }
make || complain 'does not build'
"$tools/enter" --root "$new" -- /usr/tavo/bin/probe x
same 'a program of ours runs inside' 21 $?
same 'a file of ours is there' "$(cat "$scratch/main.c")" "$("$tools/enter" --root "$new" -- cat /etc/extra.conf)"

first=$(stat -c %i "$new/tree")
start=$(date +%s%N)
make
took=$((($(date +%s%N) - start) / 1000000))
same 'nothing to do' "$first" "$(stat -c %i "$new/tree")"
[[ $took -lt 800 ]] || complain "nothing to do took $took ms"
sed -i s/21/22/ "$scratch/main.c" && cc -o "$scratch/probe" "$scratch/main.c"
make
"$tools/enter" --root "$new" -- /usr/tavo/bin/probe x
same 'a changed program' 22 $?

# Under chroot alone the programs are shared with the tree: editing one is noticed, and the next build repairs it.
if [[ $(id -u) -eq 0 ]]; then
    "$tools/enter" --root "$new" --form chroot -- /bin/sh -c 'echo x >>/usr/tavo/bin/probe' || complain 'editing a copied file does no harm'
    for edited in /usr/bin/killall /usr/bin/bash; do
        message=$("$tools/enter" --root "$new" --form chroot -- /bin/sh -c "echo x >>$edited" 2>&1)
        same "edited $edited" 125 $?
        [[ $message == *" changed $new/tree/usr/bin/"* ]] || complain "edited $edited: $message"
        make
        "$tools/enter" --root "$new" --form chroot -- true || complain "not repaired: $edited"
    done
    cmp "$(command -v bash)" "$new/tree/usr/bin/bash" || complain 'bash is not repaired'
fi

# Every command that is named by its whole path in the appliance's scripts and tools is there, and no link leads out of
# the tree: a build that followed one would write to this machine.
for path in /bin/{sh,mv,cp,rm,touch,cat,grep,echo,kill,ps,ping,busybox} /sbin/{mdadm,sfdisk,ifconfig,route,ip,dhcpcd,lvm,pvcreate,vgs} \
    /usr/bin/killall /usr/sbin/exportfs; do
    "$tools/enter" --root "$new" -- test -x "$path" || complain "no $path"
done
same 'links that lead out' '' "$(find "$new/tree" -type l -lname '/*' ! -path "$new/tree/dev/*")"
exit $failed
