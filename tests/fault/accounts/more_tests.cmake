# The calls are those of the table of all calls.
set(every_call ${PROJECT_SOURCE_DIR}/tests/fault/every_call)
set(sources ${every_call}/account_calls.cpp ${every_call}/call.cpp ${every_call}/stand_ins.cpp)
set_source_files_properties(${sources} PROPERTIES SKIP_PRECOMPILE_HEADERS ON)
target_sources(${test} PRIVATE ${sources})
