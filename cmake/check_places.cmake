# Fails when a header of lib/ is the place of a report in LIBRARY: only source files have a module name.
execute_process(COMMAND ${READELF} --string-dump=.rodata ${LIBRARY} OUTPUT_VARIABLE strings ERROR_QUIET
    COMMAND_ERROR_IS_FATAL ANY)
string(REGEX MATCHALL "[^ \n]*lib/[a-z]+/[a-z_0-9/]+\\.h\n" headers "${strings}")
if(headers)
    list(JOIN headers " " headers)
    file(REMOVE ${LIBRARY})
    message(FATAL_ERROR "These headers report failures under their own name; give the calls a Where: ${headers}")
endif()
