# The packets and the table are no part of the library.
target_link_libraries(${test} PRIVATE findhostd_parts)
