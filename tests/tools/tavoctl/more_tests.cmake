# What tavoctl reads from pages of bytes is tested without a drive.
set(tavoctl_folder ${PROJECT_SOURCE_DIR}/tools/tavoctl)
target_sources(tools_tavoctl_test PRIVATE ${tavoctl_folder}/storage/smart_pages.cpp)
set_source_files_properties(${tavoctl_folder}/storage/smart_pages.cpp PROPERTIES SKIP_PRECOMPILE_HEADERS ON)
target_include_directories(tools_tavoctl_test PRIVATE ${tavoctl_folder})
target_link_libraries(tools_tavoctl_test PRIVATE crypt)

# The texts that go with tavoctl are built for the building machine; the program only prints here.
add_test(NAME tavoctl_texts COMMAND ${folder}/texts $<TARGET_PROPERTY:tavoctl_man_page,MAN_PAGE>
    ${PROJECT_SOURCE_DIR} ${CMAKE_CROSSCOMPILING_EMULATOR} $<TARGET_FILE:tavoctl>)
set_tests_properties(tavoctl_texts PROPERTIES TIMEOUT 120)

# What the verbs print as JSON, against the schemas that are installed, by a validator that is not tavoctl's own.
add_test(NAME tavoctl_schemas COMMAND ${folder}/schemas $<TARGET_PROPERTY:tavoctl_schemas,FOLDER_OF_SCHEMAS>
    ${TAVO_ENTER} ${TAVO_ENTER_OPTIONS} --)
set_tests_properties(tavoctl_schemas PROPERTIES TIMEOUT 300)

# Disks that say that they sleep, and one that fails, for tavoctl and the tools that it runs in the virtual appliance.
foreach(drives sleepy_drives failing_drive)
    add_library(${drives} MODULE ${folder}/preload/${drives}.cpp)
    target_compile_options(${drives} PRIVATE -U_TIME_BITS -U_FILE_OFFSET_BITS)
    string(TOUPPER ${drives} name)
    target_compile_definitions(tools_tavoctl_test PRIVATE TEST_${name}="$<TARGET_FILE:${drives}>")
    add_dependencies(tools_tavoctl_test ${drives})
endforeach()
