# The fuzz build: every library of ours is compiled with libFuzzer's coverage
# hooks and with AddressSanitizer and UndefinedBehaviorSanitizer, so that a
# reader's fault shows as a crash of the target that feeds it. Only clang has
# libFuzzer; the `fuzz` preset chooses it.
if(NOT CMAKE_CXX_COMPILER_ID STREQUAL "Clang")
  message(FATAL_ERROR "ARCHWAY_FUZZ needs clang (the `fuzz` preset sets it)")
endif()
set(ARCHWAY_FUZZ_FLAGS -fsanitize=fuzzer-no-link,address,undefined -fno-sanitize-recover=all
    -fno-omit-frame-pointer -g1)
add_compile_options(${ARCHWAY_FUZZ_FLAGS})
add_link_options(-fsanitize=address,undefined)

# archway_fuzzer(NAME <name> SOURCE <file> LIBS <our libs>...)
# One libFuzzer program, fuzz_<name>; its seeds are in tests/fuzz/corpus/<name>
# and, for a text format, its dictionary in tests/fuzz/dict/<name>.dict.
function(archway_fuzzer)
  cmake_parse_arguments(A "" "NAME;SOURCE" "LIBS" ${ARGN})
  set(target fuzz_${A_NAME})
  add_executable(${target} ${A_SOURCE} ${PROJECT_SOURCE_DIR}/tests/fuzz/FuzzSupport.cpp)
  target_compile_options(${target} PRIVATE ${ARCHWAY_WARNINGS})
  target_include_directories(${target} PRIVATE ${PROJECT_SOURCE_DIR})
  target_link_libraries(${target} PRIVATE ${A_LIBS})
  target_link_options(${target} PRIVATE -fsanitize=fuzzer)
  add_dependencies(fuzzers ${target})
endfunction()
