# How everything in the tree is compiled: warnings, hardening, 64-bit time and file offsets on every target.

add_library(tavo_rules INTERFACE)

# 32-bit ARM has 32-bit time_t and off_t by default; volumes are larger, and the year 2038 is near.
target_compile_definitions(tavo_rules INTERFACE _GNU_SOURCE _FILE_OFFSET_BITS=64 _TIME_BITS=64)

target_compile_options(tavo_rules INTERFACE
    -Wall -Wextra -Wconversion -Wshadow -Wformat=2 "$<$<BOOL:${TAVO_WERROR}>:-Werror>" -fno-common
    "$<$<COMPILE_LANGUAGE:CXX>:-Wnon-virtual-dtor>"
    "-ffile-prefix-map=${PROJECT_SOURCE_DIR}/=")
if(CMAKE_SYSTEM_PROCESSOR MATCHES "arm")
    # The note about the parameter passing of GCC 7 says nothing to us: everything is built by one compiler.
    target_compile_options(tavo_rules INTERFACE "$<$<COMPILE_LANG_AND_ID:CXX,GNU>:-Wno-psabi>")
endif()
if(TAVO_HARDEN)
    target_compile_options(tavo_rules INTERFACE -fstack-protector-strong
        "$<$<COMPILE_LANG_AND_ID:CXX,GNU>:-fstack-clash-protection>")
    if(CMAKE_SYSTEM_PROCESSOR MATCHES "x86_64|AMD64")
        target_compile_options(tavo_rules INTERFACE -fcf-protection)
    endif()
    target_link_options(tavo_rules INTERFACE LINKER:-z,relro,-z,now,-z,noexecstack)
endif()

if(TAVO_SANITIZE)
    target_compile_options(tavo_rules INTERFACE -fsanitize=address,undefined -fno-sanitize-recover=undefined
                                                -fno-omit-frame-pointer)
    target_link_options(tavo_rules INTERFACE -fsanitize=address,undefined)
elseif(TAVO_FUZZ)
    target_compile_options(tavo_rules INTERFACE -fsanitize=fuzzer-no-link,address,undefined -fno-sanitize-recover=all
                                                -fno-omit-frame-pointer)
    target_link_options(tavo_rules INTERFACE -fsanitize=address,undefined)
elseif(TAVO_HARDEN)
    target_compile_options(tavo_rules INTERFACE
        "$<$<NOT:$<OR:$<CONFIG:Debug>,$<BOOL:$<TARGET_PROPERTY:TAVO_QUICK>>>>:-U_FORTIFY_SOURCE;-D_FORTIFY_SOURCE=2>")
endif()

# For programs that run once after every build: compiled quickly, with line numbers for the debugger.
function(tavo_compile_quickly target)
    set_target_properties(${target} PROPERTIES TAVO_QUICK ON)
    target_compile_options(${target} PRIVATE -O0 -g1)
endfunction()

# Compiles these headers once for the target, in builds that want it.
function(tavo_precompile target)
    if(TAVO_PRECOMPILE)
        target_precompile_headers(${target} PRIVATE ${ARGN})
        # From there g++ 12 warns wrongly of overruns inside std::string.
        target_compile_options(${target} PRIVATE
            "$<$<COMPILE_LANG_AND_ID:CXX,GNU>:-Wno-array-bounds;-Wno-restrict;-Wno-stringop-overflow;-Wno-stringop-overread>")
    endif()
endfunction()

# Compiles the files of a target in batches. A batch never mixes folders, so a new file shuffles those of its folder only.
function(tavo_unity_batches target)
    if(NOT TAVO_UNITY)
        return()
    endif()
    set_target_properties(${target} PROPERTIES UNITY_BUILD ON UNITY_BUILD_MODE GROUP)
    # Of std::variant in a batch g++ 12 says so where nothing is read uninitialised.
    target_compile_options(${target} PRIVATE "$<$<COMPILE_LANG_AND_ID:CXX,GNU>:-Wno-maybe-uninitialized>")
    set(folder_before)
    foreach(source IN LISTS ARGN)
        cmake_path(GET source PARENT_PATH folder)
        if(NOT folder STREQUAL folder_before)
            set(folder_before ${folder})
            set(in_folder 0)
        endif()
        math(EXPR batch "${in_folder} / 12")
        math(EXPR in_folder "${in_folder} + 1")
        string(MAKE_C_IDENTIFIER "${folder}_${batch}" group)
        set_source_files_properties(${source} PROPERTIES UNITY_GROUP ${group})
    endforeach()
endfunction()
