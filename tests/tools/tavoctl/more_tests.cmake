target_link_libraries(tools_tavoctl_test PRIVATE crypt)

# The texts that go with tavoctl are for the machine of whoever builds it; the program only prints here.
add_test(NAME tavoctl_texts COMMAND ${folder}/texts $<TARGET_PROPERTY:tavoctl_man_page,MAN_PAGE>
    ${PROJECT_SOURCE_DIR} ${CMAKE_CROSSCOMPILING_EMULATOR} $<TARGET_FILE:tavoctl>)
set_tests_properties(tavoctl_texts PROPERTIES TIMEOUT 120)
