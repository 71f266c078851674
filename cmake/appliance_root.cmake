# Tests run inside the appliance root: the library uses /etc/passwd, /tmp/lock and /sbin/mdadm as they are, so every
# test case enters a private copy of that root and none can touch the machine.

set(TAVO_ENTER ${PROJECT_SOURCE_DIR}/tools/appliance/enter)
set(TAVO_ROOT ${PROJECT_BINARY_DIR}/appliance)

function(tavo_discover_tests test)
    set_target_properties(${test} PROPERTIES CROSSCOMPILING_EMULATOR
        "${TAVO_ENTER};--root;${TAVO_ROOT};--bind;${PROJECT_BINARY_DIR};--")
    gtest_discover_tests(${test} DISCOVERY_MODE PRE_TEST TEST_PREFIX "${test}." PROPERTIES TIMEOUT 120)
endfunction()
