# How every target of the project is compiled.

set(CMAKE_CXX_STANDARD 17)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS ON) # posix_spawn, statx and other GNU interfaces
set(CMAKE_C_STANDARD 11)
set(CMAKE_C_STANDARD_REQUIRED ON)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)

if(FILEINDEX_SANITIZE)
    add_compile_options(-fsanitize=${FILEINDEX_SANITIZE} -fno-sanitize-recover=all
                        -fno-omit-frame-pointer)
    add_link_options(-fsanitize=${FILEINDEX_SANITIZE})
endif()

# Every module tells libFuzzer what it ran through; only the fuzz targets carry libFuzzer itself.
if(FILEINDEX_BUILD_FUZZ)
    if(NOT CMAKE_CXX_COMPILER_ID STREQUAL "Clang")
        message(FATAL_ERROR "FILEINDEX_BUILD_FUZZ needs clang: libFuzzer is part of it")
    endif()
    add_compile_options(-fsanitize=fuzzer-no-link)
endif()

# Warnings belong to this project's targets alone and never reach a caller's build.
function(fileindex_warnings target)
    target_compile_options(${target} PRIVATE -Wall -Wextra -Wpedantic -Wshadow -Wconversion)
    if(FILEINDEX_DEVELOPER)
        target_compile_options(${target} PRIVATE -Werror)
    endif()
endfunction()

# What a developer builds again and again, and what nobody waits for while it runs.
function(fileindex_compile_quickly target)
    if(FILEINDEX_DEVELOPER)
        target_compile_options(${target} PRIVATE -O0)
    endif()
endfunction()

# As target_precompile_headers. Packages and sanitized builds do without, and so find the include that
# a file lacks.
function(fileindex_precompile target)
    if(FILEINDEX_DEVELOPER)
        target_precompile_headers(${target} ${ARGN})
    endif()
endfunction()
