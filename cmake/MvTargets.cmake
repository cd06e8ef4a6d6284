# One small helper per kind of target, so that every folder gets the same
# warnings, visibility and include layout.

set(MV_WARNINGS -Wall -Wextra -Wno-unused-parameter -Wno-missing-field-initializers)

# mv_library(NAME <target> TYPE SHARED|STATIC|INTERFACE SOURCES ... PUBLIC_DEPS ... PRIVATE_DEPS ... INCLUDE <dir>)
function(mv_library)
  cmake_parse_arguments(A "" "NAME;TYPE;INCLUDE" "SOURCES;PUBLIC_DEPS;PRIVATE_DEPS" ${ARGN})
  if(A_TYPE STREQUAL "INTERFACE")
    add_library(${A_NAME} INTERFACE)
    target_include_directories(${A_NAME} INTERFACE ${A_INCLUDE})
    target_link_libraries(${A_NAME} INTERFACE ${A_PUBLIC_DEPS})
    return()
  endif()
  add_library(${A_NAME} ${A_TYPE} ${A_SOURCES})
  target_compile_options(${A_NAME} PRIVATE ${MV_WARNINGS})
  if(A_INCLUDE)
    target_include_directories(${A_NAME} PUBLIC ${A_INCLUDE})
  endif()
  target_link_libraries(${A_NAME} PUBLIC ${A_PUBLIC_DEPS} PRIVATE ${A_PRIVATE_DEPS})
endfunction()

# mv_test(NAME <target> SOURCES ... DEPS ... LABELS ...)
# One gtest executable; every test case runs in its own process (clean statics),
# and the whole executable runs once more as one process (test <target>, label
# "whole"): what a developer running the binary gets must be the same.
# Tests find the build's lib/ and bin/ next to their own folder (<build>/tests);
# MV_ADDON and MV_BIN override that when set by hand.
function(mv_test)
  cmake_parse_arguments(A "" "NAME" "SOURCES;DEPS;LABELS" ${ARGN})
  add_executable(${A_NAME} ${A_SOURCES})
  target_compile_options(${A_NAME} PRIVATE ${MV_WARNINGS})
  target_link_libraries(${A_NAME} PRIVATE ${A_DEPS} GTest::gtest GTest::gmock GTest::gtest_main)
  set_target_properties(${A_NAME} PROPERTIES RUNTIME_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/tests)
  gtest_discover_tests(${A_NAME}
    DISCOVERY_TIMEOUT 60
    PROPERTIES LABELS "${A_LABELS}" ENVIRONMENT "QT_QPA_PLATFORM=offscreen")
  add_test(NAME ${A_NAME} COMMAND ${A_NAME})
  set_tests_properties(${A_NAME} PROPERTIES LABELS "${A_LABELS};whole" ENVIRONMENT "QT_QPA_PLATFORM=offscreen")
endfunction()

# Subfolders with a CMakeLists.txt, added in name order.
function(mv_add_subfolders)
  file(GLOB children LIST_DIRECTORIES true RELATIVE ${CMAKE_CURRENT_SOURCE_DIR} ${CMAKE_CURRENT_SOURCE_DIR}/*)
  list(SORT children)
  foreach(child ${children})
    if(EXISTS ${CMAKE_CURRENT_SOURCE_DIR}/${child}/CMakeLists.txt)
      add_subdirectory(${child})
    endif()
  endforeach()
endfunction()
