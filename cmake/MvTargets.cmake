# One small helper per kind of target, so that every folder gets the same
# warnings, visibility and include layout.

set(MV_WARNINGS -Wall -Wextra -Wno-unused-parameter -Wno-missing-field-initializers)

# mv_include_root(<out-var> <name> <folder>...)
# Each layer's include root: a directory in the build tree holding only links
# to the layer's own source folders ("data", "terminal/host"...). A target puts
# it on its public include path, so "data/CellStore.h" keeps its spelling while
# a target sees only the folders of the targets it links.
function(mv_include_root out name)
  set(root ${CMAKE_BINARY_DIR}/include-roots/${name})
  foreach(folder ${ARGN})
    set(source ${CMAKE_SOURCE_DIR}/${folder})
    if(NOT IS_DIRECTORY ${source})
      message(FATAL_ERROR "include root ${name}: folder ${folder} does not exist")
    endif()
    set(link ${root}/${folder})
    if(IS_SYMLINK ${link})
      file(READ_SYMLINK ${link} current)
      if(current STREQUAL source)
        continue()
      endif()
      file(REMOVE ${link})
    elseif(EXISTS ${link})
      message(FATAL_ERROR "include root ${name}: ${link} exists and is not a link")
    endif()
    get_filename_component(parent ${link} DIRECTORY)
    file(MAKE_DIRECTORY ${parent})
    file(CREATE_LINK ${source} ${link} SYMBOLIC)
  endforeach()
  set(${out} ${root} PARENT_SCOPE)
endfunction()

# mv_library(NAME <target> TYPE SHARED|STATIC|INTERFACE SOURCES ... PUBLIC_DEPS ... PRIVATE_DEPS ...
#            INCLUDE <dir> | FOLDERS <folder>...)
# FOLDERS: the source folders the target is made of; they become its include
# root (see mv_include_root).
function(mv_library)
  cmake_parse_arguments(A "" "NAME;TYPE;INCLUDE" "SOURCES;PUBLIC_DEPS;PRIVATE_DEPS;FOLDERS" ${ARGN})
  if(A_FOLDERS)
    mv_include_root(A_INCLUDE ${A_NAME} ${A_FOLDERS})
  endif()
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
