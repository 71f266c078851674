# Tests run inside the appliance root: the library uses /etc/passwd, /tmp/lock and /sbin/mdadm as they are, so every
# test case enters a private copy of that root and none can touch the machine.

set(TAVO_ENTER ${PROJECT_SOURCE_DIR}/tools/appliance/enter)
set(TAVO_ROOT ${PROJECT_BINARY_DIR}/appliance)
set(TAVO_ENTER_OPTIONS --root ${TAVO_ROOT} --bind ${PROJECT_BINARY_DIR})

if(CMAKE_CROSSCOMPILING)
    find_program(TAVO_EMULATOR qemu-arm-static REQUIRED)
    list(APPEND TAVO_ENTER_OPTIONS --emulator ${TAVO_EMULATOR})
    # The same programs once more, on a 32-bit ARM kernel with disks: preset "appliance".
    add_test(NAME virtual_appliance
        COMMAND ${PROJECT_SOURCE_DIR}/tools/appliance/arm/run-tests ${PROJECT_BINARY_DIR})
    set_tests_properties(virtual_appliance PROPERTIES
        LABELS virtual-appliance SKIP_RETURN_CODE 77 TIMEOUT 3600 RUN_SERIAL ON)
endif()

function(tavo_discover_tests test)
    set_target_properties(${test} PROPERTIES CROSSCOMPILING_EMULATOR
        "${TAVO_ENTER};${TAVO_ENTER_OPTIONS};--")
    gtest_discover_tests(${test} DISCOVERY_MODE PRE_TEST NO_PRETTY_VALUES TEST_PREFIX "${test}." PROPERTIES TIMEOUT 300)
endfunction()
