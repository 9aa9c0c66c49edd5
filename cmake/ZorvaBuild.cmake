# Common to every target: the language level, warnings as errors, hidden symbols, sanitizers, output folders.

set(CMAKE_CXX_STANDARD 20)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_C_STANDARD 11)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_CXX_FLAGS_RELEASE "-O2 -DNDEBUG")
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_C_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(CMAKE_LIBRARY_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/lib)
set(CMAKE_RUNTIME_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/bin)
set(CMAKE_BUILD_RPATH_USE_ORIGIN ON)
include(GNUInstallDirs)

find_program(ZORVA_CCACHE ccache)
if(ZORVA_CCACHE)
  # ccache must know about precompiled headers that they are newer than the build and that no macro is hidden in them.
  set(ZORVA_CCACHE_LAUNCHER ${CMAKE_COMMAND} -E env
    CCACHE_SLOPPINESS=pch_defines,time_macros,include_file_mtime,include_file_ctime ${ZORVA_CCACHE})
  set(CMAKE_CXX_COMPILER_LAUNCHER ${ZORVA_CCACHE_LAUNCHER})
  set(CMAKE_C_COMPILER_LAUNCHER ${ZORVA_CCACHE_LAUNCHER})
  add_compile_options("$<$<COMPILE_LANG_AND_ID:CXX,GNU>:-fpch-preprocess>")
endif()

# Code that runs once in a command or at a start of the server, and is long: half as large, at no cost that is noticed.
set(ZORVA_SMALL_CODE "$<$<CONFIG:Release>:-Os>")
function(zorva_prefer_small_code)
  foreach(target ${ARGN})
    target_compile_options(${target} PRIVATE ${ZORVA_SMALL_CODE})
  endforeach()
endfunction()
# What no program uses of a library is left out.
add_compile_options("$<$<CONFIG:Release>:-ffunction-sections;-fdata-sections>")
add_link_options("$<$<CONFIG:Release>:-Wl,--gc-sections>")

# The platform symbol of CMPI; the headers refuse to compile without one.
add_compile_definitions(CMPI_PLATFORM_LINUX_GENERIC_GNU)

add_compile_options(
  -Wall -Wextra -Wpedantic -Wconversion -Wshadow -Werror
  -ffile-prefix-map=${CMAKE_SOURCE_DIR}/=)
# When it optimizes, g++ 12 warns of overlapping copies in the concatenation of std::string (GCC bug 105651) and of
# reads of uninitialized values in copies of std::variant (GCC bug 105562), where there are none.
add_compile_options(
  "$<$<AND:$<CXX_COMPILER_ID:GNU>,$<VERSION_LESS:$<CXX_COMPILER_VERSION>,13>>:-Wno-restrict;-Wno-maybe-uninitialized>")
# There is enough memory: without garbage collection g++ needs a tenth less time for a test.
add_compile_options("$<$<COMPILE_LANG_AND_ID:CXX,GNU>:SHELL:--param ggc-min-heapsize=524288>")
add_link_options(-Wl,--as-needed)

if(ZORVA_SANITIZE STREQUAL "address")
  add_compile_options(-fsanitize=address,undefined -fno-sanitize-recover=all -fno-omit-frame-pointer)
  add_link_options(-fsanitize=address,undefined)
elseif(ZORVA_SANITIZE STREQUAL "thread")
  add_compile_options(-fsanitize=thread -fno-omit-frame-pointer)
  add_link_options(-fsanitize=thread)
elseif(NOT ZORVA_SANITIZE STREQUAL "")
  message(FATAL_ERROR "ZORVA_SANITIZE is '${ZORVA_SANITIZE}'; it takes address, thread or nothing")
endif()

# The coverage that guides the fuzzer.
if(ZORVA_FUZZ)
  add_compile_options(-fsanitize=fuzzer-no-link)
endif()

if(ZORVA_COVERAGE)
  # Atomic counters, because with threads some counts would otherwise be below 0. Full source paths, so that the reports
  # find the files, whatever the compiler's macros say.
  add_compile_options(--coverage -fprofile-abs-path -fprofile-update=atomic
    -fprofile-prefix-map=${CMAKE_SOURCE_DIR}/=${CMAKE_SOURCE_DIR}/)
  add_link_options(--coverage)
endif()

# zorva_limit_exports(TARGET FILE): the shared library TARGET exports only the symbols that FILE lists as global. A
# symbol inside cannot be bound from outside, so the library can be unloaded, and two of them do not mix.
function(zorva_limit_exports target file)
  target_link_options(${target} PRIVATE -Wl,--version-script=${CMAKE_CURRENT_SOURCE_DIR}/${file})
  set_property(TARGET ${target} APPEND PROPERTY LINK_DEPENDS ${CMAKE_CURRENT_SOURCE_DIR}/${file})
  target_compile_options(${target} PRIVATE $<$<CXX_COMPILER_ID:GNU>:-fno-gnu-unique>)
endfunction()

# ThreadSanitizer cannot map its shadow memory if the kernel randomizes addresses too widely.
set(ZORVA_LAUNCHER)
if(ZORVA_SANITIZE STREQUAL "thread")
  set(ZORVA_LAUNCHER setarch -R)
endif()

# zorva_run_at_build(PROGRAM OUTPUT file ARGUMENTS arguments... DEPENDS files...): PROGRAM, of this build, makes the file.
function(zorva_run_at_build program)
  cmake_parse_arguments(PARSE_ARGV 1 run "" OUTPUT "ARGUMENTS;DEPENDS")
  add_custom_command(OUTPUT ${run_OUTPUT}
    COMMAND ${ZORVA_LAUNCHER} $<TARGET_FILE:${program}> ${run_ARGUMENTS}
    DEPENDS ${program} ${run_DEPENDS} VERBATIM)
endfunction()

# zorva_add_manual(PROGRAM WORD): once it is built, PROGRAM writes its manual and what else is made of its texts into
# manual/PROGRAM of the build folder, as "PROGRAM WORD FOLDER". Its pages are installed.
function(zorva_add_manual program word)
  set(folder ${CMAKE_BINARY_DIR}/manual/${program})
  add_custom_command(OUTPUT ${folder}/done
    COMMAND ${CMAKE_COMMAND} -E rm -rf ${folder}
    COMMAND ${ZORVA_LAUNCHER} $<TARGET_FILE:${program}> ${word} ${folder}
    COMMAND ${CMAKE_COMMAND} -E touch ${folder}/done
    DEPENDS ${program} VERBATIM)
  add_custom_target(${program}_manual ALL DEPENDS ${folder}/done)
  install(DIRECTORY ${folder}/ DESTINATION ${CMAKE_INSTALL_MANDIR}
    FILES_MATCHING PATTERN "*.1" PATTERN "*.5" PATTERN "*.8" PATTERN "completion" EXCLUDE)
endfunction()

# Headers that many sources include are compiled once for all of them. A build without tests does without, so it shows
# whether each source includes all that it uses.
option(ZORVA_PRECOMPILE "Precompile the standard library's and GoogleTest's headers" ${ZORVA_BUILD_TESTS})

# zorva_precompile_headers(TARGETS...): their sources use precompiled headers of the standard library.
function(zorva_precompile_headers)
  if(ZORVA_PRECOMPILE)
    foreach(target ${ARGN})
      target_precompile_headers(${target} REUSE_FROM zorva_standard_headers)
    endforeach()
  endif()
endfunction()

# Tests report where they failed, so their debug information is at most file and line for a stack trace; local variables
# would cost a sixth of their compilation. Position-independent like the libraries, because a precompiled header serves
# only one kind of code.
set(ZORVA_TEST_DEBUG_INFO "-g1" CACHE STRING "Debug information of the tests; -g to step through one in a debugger")
set(ZORVA_TEST_OPTIONS -fPIC "$<$<CONFIG:Debug>:${ZORVA_TEST_DEBUG_INFO}>")
# The checks for undefined behaviour are in the product's code. In the tests they would cost a third of the compilation.
if(ZORVA_SANITIZE STREQUAL "address")
  list(APPEND ZORVA_TEST_OPTIONS -fno-sanitize=undefined)
endif()

# zorva_build_as_test(TARGET): compiles a program or a library like all tests.
function(zorva_build_as_test target)
  target_link_libraries(${target} PUBLIC GTest::gmock)
  target_compile_options(${target} PRIVATE ${ZORVA_TEST_OPTIONS})
  if(ZORVA_PRECOMPILE)
    target_link_libraries(${target} PUBLIC zorva_test_headers)
    target_precompile_headers(${target} REUSE_FROM zorva_test_headers)
  endif()
endfunction()

# zorva_add_test(NAME [ALONE | PARTS n] SOURCES files... LIBS libraries... DEPENDS targets...): one GoogleTest program.
# ctest runs it as a whole, because the start of a process costs more than most cases do. PARTS: as NAME.1 to NAME.n at the
# same time, each with every n-th case. ALONE: each case in a process of its own, under its name. The label is NAME.
function(zorva_add_test name)
  if(NOT ZORVA_BUILD_TESTS)
    return()
  endif()
  cmake_parse_arguments(ARG "ALONE" "PARTS" "SOURCES;LIBS;DEPENDS" ${ARGN})
  add_executable(${name} ${ARG_SOURCES})
  target_link_libraries(${name} PUBLIC ${ARG_LIBS} GTest::gtest_main)
  zorva_build_as_test(${name})
  target_compile_definitions(${name} PRIVATE
    ZORVA_LIB_DIR="${CMAKE_LIBRARY_OUTPUT_DIRECTORY}"
    ZORVA_BIN_DIR="${CMAKE_RUNTIME_OUTPUT_DIRECTORY}"
    ZORVA_SOURCE_DIR="${CMAKE_SOURCE_DIR}")
  if(ARG_DEPENDS)
    add_dependencies(${name} ${ARG_DEPENDS})
  endif()
  if(ARG_ALONE)
    gtest_discover_tests(${name} DISCOVERY_MODE PRE_TEST NO_PRETTY_VALUES PROPERTIES TIMEOUT 300 LABELS ${name})
    return()
  elseif(NOT ARG_PARTS)
    set(ARG_PARTS 1)
  endif()
  foreach(part RANGE 1 ${ARG_PARTS})
    math(EXPR index "${part} - 1")
    add_test(NAME ${name}.${part} COMMAND ${name})
    set_tests_properties(${name}.${part} PROPERTIES TIMEOUT 600 LABELS ${name}
      ENVIRONMENT "GTEST_TOTAL_SHARDS=${ARG_PARTS};GTEST_SHARD_INDEX=${index}")
  endforeach()
endfunction()
