# Project-wide compile settings and the helpers every folder uses.

add_compile_options(-Wall -Wextra -Werror -Wno-missing-field-initializers)

# GCC's unique symbols (from inline statics such as make_shared's) mark a
# library as never unloadable; the module must be able to release the
# product libraries it loads.
if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
  add_compile_options(-fno-gnu-unique)
endif()

if(SORVIK_FUZZ)
  add_compile_options(-fsanitize=fuzzer-no-link)
  add_custom_target(fuzzers)
  file(WRITE ${CMAKE_BINARY_DIR}/fuzzers.txt "")
endif()

if(SORVIK_SANITIZE)
  add_compile_options(-fsanitize=${SORVIK_SANITIZE} -fno-omit-frame-pointer -fno-sanitize-recover=all)
  add_link_options(-fsanitize=${SORVIK_SANITIZE})
endif()

# A static, position-independent library that the module and tools link.
function(sorvik_add_library name)
  cmake_parse_arguments(ARG "" "" "SOURCES;PUBLIC_LIBS;PRIVATE_LIBS" ${ARGN})
  add_library(${name} STATIC ${ARG_SOURCES})
  target_include_directories(${name} PUBLIC ${PROJECT_SOURCE_DIR})
  target_link_libraries(${name} PUBLIC ${ARG_PUBLIC_LIBS} PRIVATE ${ARG_PRIVATE_LIBS})
endfunction()

# One GoogleTest executable, registered with CTest test by test.
# LABELS threaded marks tests that the ThreadSanitizer run repeats.
function(sorvik_add_gtest name)
  cmake_parse_arguments(ARG "" "" "SOURCES;LIBS;LABELS;ENVIRONMENT" ${ARGN})
  add_executable(${name} ${ARG_SOURCES})
  target_link_libraries(${name} PRIVATE ${ARG_LIBS} sorvik_testsupport GTest::gmock GTest::gtest_main)
  set(properties TIMEOUT 120)
  if(ARG_LABELS)
    list(APPEND properties LABELS "${ARG_LABELS}")
  endif()
  # Test names without the printed parameter: its bytes may hold addresses.
  gtest_discover_tests(${name}
    NO_PRETTY_VALUES
    DISCOVERY_MODE PRE_TEST
    DISCOVERY_TIMEOUT 60
    PROPERTIES ${properties})
  # The discovered tests get their environment from a script CTest runs after
  # discovery: handed through gtest_discover_tests, every variable after the
  # first would be read as a property name.
  if(ARG_ENVIRONMENT)
    set(environment_script "${CMAKE_CURRENT_BINARY_DIR}/${name}_environment.cmake")
    file(WRITE "${environment_script}"
      "if(${name}_TESTS)\n"
      "  set_tests_properties(\${${name}_TESTS} PROPERTIES ENVIRONMENT [==[${ARG_ENVIRONMENT}]==])\n"
      "endif()\n")
    set_property(DIRECTORY APPEND PROPERTY TEST_INCLUDE_FILES "${environment_script}")
  endif()
endfunction()

# A libFuzzer target over LLVMFuzzerTestOneInput. In the fuzz build (clang,
# SORVIK_FUZZ) it is a real fuzzer; in every other build it is a replay tool
# that CTest runs over the seed corpus, so the corpus is checked on each run.
function(sorvik_add_fuzzer name)
  cmake_parse_arguments(ARG "" "CORPUS" "SOURCES;LIBS" ${ARGN})
  if(SORVIK_FUZZ)
    add_executable(${name} ${ARG_SOURCES})
    target_link_libraries(${name} PRIVATE ${ARG_LIBS})
    target_link_options(${name} PRIVATE -fsanitize=fuzzer)
    set_target_properties(${name} PROPERTIES RUNTIME_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/fuzzers)
    add_dependencies(fuzzers ${name})
    file(APPEND ${CMAKE_BINARY_DIR}/fuzzers.txt "${name} ${ARG_CORPUS}\n")
  elseif(SORVIK_BUILD_TESTS)
    add_executable(${name} ${ARG_SOURCES} ${PROJECT_SOURCE_DIR}/fuzz/replay.cpp)
    target_link_libraries(${name} PRIVATE ${ARG_LIBS})
    add_test(NAME fuzz_replay.${name} COMMAND ${name} ${ARG_CORPUS})
  endif()
endfunction()
