# One helper per module kind. Each subsystem declares its static library here
# with the libraries it depends on; every library and test comes in two
# variants: the plain one and a "_san" one built with AddressSanitizer and
# UndefinedBehaviorSanitizer, so that one ctest run covers both.

set(ARCHWAY_WARNINGS -Wall -Wextra -Werror)
# g++ 12 at -O3 reports overlapping copies inside std::string's own inlined
# code that cannot happen (a known false positive) wherever a piece is put in
# front of a temporary string; our code appends instead, and for that
# compiler alone any such report stays a warning rather than an error.
if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU" AND CMAKE_CXX_COMPILER_VERSION VERSION_GREATER_EQUAL 12
   AND CMAKE_CXX_COMPILER_VERSION VERSION_LESS 13)
  list(APPEND ARCHWAY_WARNINGS -Wno-error=restrict)
endif()
# -O1 with line tables keeps the sanitizer variant quick to build while its
# reports still name files and lines.
set(ARCHWAY_SAN_FLAGS -fsanitize=address,undefined -fno-sanitize-recover=all
    -fno-omit-frame-pointer -O1 -g1)

# archway_library(NAME <name> DIRS <dir>... [EXCLUDE <dir>...]
#                 [DEPENDS <our libs>...] [SYSTEM <imported targets or flags>...])
# Sources are all .cpp files below the given folders, less those below the
# excluded ones (a subfolder that is a library of its own).
function(archway_library)
  cmake_parse_arguments(A "" "NAME" "DIRS;EXCLUDE;DEPENDS;SYSTEM" ${ARGN})
  set(sources)
  foreach(dir ${A_DIRS})
    file(GLOB_RECURSE found CONFIGURE_DEPENDS ${PROJECT_SOURCE_DIR}/${dir}/*.cpp)
    list(APPEND sources ${found})
  endforeach()
  foreach(dir ${A_EXCLUDE})
    list(FILTER sources EXCLUDE REGEX "^${PROJECT_SOURCE_DIR}/${dir}/")
  endforeach()
  foreach(variant "" "_san")
    if(variant STREQUAL "_san" AND NOT ARCHWAY_SANITIZE)
      continue()
    endif()
    set(target ${A_NAME}${variant})
    add_library(${target} STATIC ${sources})
    target_include_directories(${target} PUBLIC ${PROJECT_SOURCE_DIR})
    target_compile_options(${target} PRIVATE ${ARCHWAY_WARNINGS})
    set_target_properties(${target} PROPERTIES POSITION_INDEPENDENT_CODE ON
                                               CXX_VISIBILITY_PRESET hidden
                                               VISIBILITY_INLINES_HIDDEN ON)
    foreach(dep ${A_DEPENDS})
      target_link_libraries(${target} PUBLIC ${dep}${variant})
    endforeach()
    target_link_libraries(${target} PUBLIC ${A_SYSTEM})
    if(variant STREQUAL "_san")
      target_compile_options(${target} PUBLIC ${ARCHWAY_SAN_FLAGS})
      target_link_options(${target} PUBLIC ${ARCHWAY_SAN_FLAGS})
    endif()
  endforeach()
endfunction()

# archway_test(NAME <name> DIRS <dir>... LIBS <our libs>... [SYSTEM ...]
#              [END_TO_END] [WINDOWED])
# One GoogleTest program per test folder, registered with CTest and linked
# with the shared test support (tests/support); the
# sanitizer variant's cases carry the prefix "san.". END_TO_END marks a
# program that drives whole runs (the program, the acceptance scenes): it is
# built plainly only, since the code it reaches has unit tests under the
# sanitizers and a second, slower pass would only lengthen the run. WINDOWED
# marks a program that opens windows: it runs under scripts/with-display.sh
# and saves its screenshots under the build's artefacts/.
function(archway_test)
  cmake_parse_arguments(A "END_TO_END;WINDOWED" "NAME" "DIRS;LIBS;SYSTEM" ${ARGN})
  set(sources)
  foreach(dir ${A_DIRS})
    file(GLOB_RECURSE found CONFIGURE_DEPENDS ${PROJECT_SOURCE_DIR}/${dir}/*.cpp)
    list(APPEND sources ${found})
  endforeach()
  if(NOT sources)
    return()
  endif()
  foreach(variant "" "_san")
    if(variant STREQUAL "_san" AND (NOT ARCHWAY_SANITIZE OR A_END_TO_END))
      continue()
    endif()
    set(target ${A_NAME}_tests${variant})
    add_executable(${target} ${sources})
    if(A_WINDOWED)
      # Each run (the test listing included) under an X server of its own.
      set_target_properties(${target} PROPERTIES CROSSCOMPILING_EMULATOR
                            ${PROJECT_SOURCE_DIR}/scripts/with-display.sh)
      target_compile_definitions(${target} PRIVATE
          ARCHWAY_ARTEFACTS_DIR="${PROJECT_BINARY_DIR}/artefacts")
    endif()
    target_compile_options(${target} PRIVATE ${ARCHWAY_WARNINGS})
    target_include_directories(${target} PRIVATE ${PROJECT_SOURCE_DIR})
    foreach(lib ${A_LIBS} archway_test_support)
      target_link_libraries(${target} PRIVATE ${lib}${variant})
    endforeach()
    target_link_libraries(${target} PRIVATE ${A_SYSTEM} GTest::gtest GTest::gmock
                                            GTest::gtest_main)
    target_compile_definitions(${target} PRIVATE
        ARCHWAY_TEST_DATA_DIR="${PROJECT_SOURCE_DIR}/tests/data")
    if(variant STREQUAL "_san")
      set(prefix "san.")
    else()
      set(prefix "")
    endif()
    gtest_discover_tests(${target} TEST_PREFIX "${prefix}${A_NAME}."
                         DISCOVERY_TIMEOUT 60
                         PROPERTIES ENVIRONMENT
                         "ASAN_OPTIONS=detect_leaks=1:abort_on_error=1;UBSAN_OPTIONS=print_stacktrace=1;LSAN_OPTIONS=suppressions=${PROJECT_SOURCE_DIR}/tests/lsan.supp")
  endforeach()
endfunction()
