#!/usr/bin/env bash
# The demonstration runs to its end: every command ends as it says.
. "$(dirname "$0")/common.sh"

$enter -- /bin/sh /usr/tavo/share/demo/story.sh >"$scratch/story" 2>&1
status=$?
same 'the story ends well' 0 "$status"
[[ $status == 0 ]] || tail -20 "$scratch/story" >&2

# The story is complete: a chapter for each name, a command of each family of tavoctl.
for chapter in $(sed -n "s/^all='\(.*\)'$/\1/p" "$tools/demo/story.sh"); do
    [[ -f $tools/demo/chapters/$chapter.sh ]] || complain "there is no chapter $chapter"
done
for family in $($enter -- tavoctl --complete ''); do
    grep -qE "^\\$ (.* )?tavoctl $family( |\$)" "$scratch/story" || complain "the story has no command of tavoctl $family"
done
