#!/usr/bin/env bash
# The tripwire notices every kind of change, on a copy: this machine's own files are not touched.
. "$(dirname "$0")/common.sh"
export TRIPWIRE_ROOT=$scratch/machine

fresh() {
    rm -rf "$TRIPWIRE_ROOT"
    mkdir -p "$TRIPWIRE_ROOT/etc" "$TRIPWIRE_ROOT/tmp"
    for name in passwd shadow group gshadow hosts hostname; do
        echo "$name" >"$TRIPWIRE_ROOT/etc/$name"
        touch -d @1000000000 "$TRIPWIRE_ROOT/etc/$name"
    done
    "$tools/tripwire" save "$scratch/before"
}

fresh
"$tools/tripwire" check "$scratch/before" || complain 'nothing changed, and it says so'
while read -r named change; do
    fresh
    (cd "$TRIPWIRE_ROOT" && eval "$change")
    if message=$("$tools/tripwire" check "$scratch/before" 2>&1); then
        complain "not noticed: $change"
    elif [[ $message != *"$named"* ]]; then
        complain "noticed but not named: $change: $message"
    fi
done <<'END'
/etc/passwd echo more >>etc/passwd
/etc/shadow echo shadoW >etc/shadow; touch -d @1000000000 etc/shadow
/etc/group cp -p etc/group x; mv x etc/group; touch etc/group
/etc/gshadow chmod 600 etc/gshadow
/etc/hosts rm etc/hosts
/etc/resolv.conf echo nameserver >etc/resolv.conf
/tmp/lock mkdir tmp/lock
/var/services mkdir -p var/services
END
unset TRIPWIRE_ROOT
# On this machine itself: links and routes are among the facts.
"$tools/tripwire" save "$scratch/real" && "$tools/tripwire" check "$scratch/real" || complain 'two looks at this machine differ'
sed 's/^link lo .*/link lo another/' "$scratch/real" >"$scratch/other"
"$tools/tripwire" check "$scratch/other" 2>/dev/null && complain 'a changed link is not noticed'
exit $failed
