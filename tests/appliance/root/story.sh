#!/usr/bin/env bash
# The demonstration tells its whole story: every command ends as it says.
. "$(dirname "$0")/common.sh"

begin=$SECONDS
$enter -- /bin/sh /usr/tavo/share/demo/story.sh >"$scratch/told" 2>&1
status=$?
same 'the story ends well' 0 "$status"
[[ $status == 0 ]] || tail -20 "$scratch/told" >&2
[[ $((SECONDS - begin)) -lt 60 ]] || complain "it takes $((SECONDS - begin)) s"
