# expect STATUS OUTPUT COMMAND...: the command ends so, and what it prints (both streams) matches the pattern.
failures=0
expect() {
    local status=$1 pattern=$2 printed ended=0
    shift 2
    printed=$("$@" 2>&1) || ended=$?
    # shellcheck disable=SC2053
    if [[ $ended -ne $status || $printed != $pattern ]]; then
        failures=$((failures + 1))
        printf 'not so: %s\n  status %s, expected %s\n  printed: %s\n  expected: %s\n' "$*" "$ended" "$status" "$printed" "$pattern"
    fi
}
