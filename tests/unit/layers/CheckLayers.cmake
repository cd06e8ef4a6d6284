# Checks the layers by their include lines:
#   cmake -DMV_SOURCE_DIR=<repo> -P CheckLayers.cmake
# Every project header is named by its folder ("data/CellStore.h",
# "terminal/sim/Market.h", "hostview/Records.h"); a folder may name only the
# folders listed for it below, and the folders marked "no Qt" no Qt header.
# A header named without a folder is one of the folder's own. Prints every
# offending line and fails when there is one.
cmake_minimum_required(VERSION 3.25)
if(NOT MV_SOURCE_DIR)
  message(FATAL_ERROR "usage: cmake -DMV_SOURCE_DIR=<repo> -P CheckLayers.cmake")
endif()

# Project header folders, as includes spell them. A folder under terminal/
# counts as its own layer ("terminal/host").
set(project_headers
  hostview hostconfig hosttitle platform
  data skin chart grid controls
  addon views
  terminal/sim terminal/host terminal/store terminal/app terminal/views
  mvtest)

# What each source folder may name. The folders in `plain_cxx` name no Qt header.
set(host_libs hostview hostconfig hosttitle)
set(ui_blocks skin chart grid controls)
set(terminal_all terminal/sim terminal/host terminal/store terminal/app terminal/views)
set(allow_host ${host_libs})
set(allow_platform platform hostview)
set(allow_data data hostview)
set(allow_skin skin hostview platform)
set(allow_chart chart hostview platform)
set(allow_grid grid skin hostview platform)
set(allow_controls controls grid skin chart data ${host_libs} platform)
set(allow_addon addon views data ${ui_blocks} ${host_libs} platform)
set(allow_views ${allow_addon})
set(allow_terminal/sim terminal/sim hostview)
set(allow_terminal/host terminal/host terminal/sim ${host_libs} platform)
set(allow_terminal/store terminal/store terminal/host ${host_libs})
set(allow_terminal/app ${terminal_all} ${host_libs} platform)
set(allow_terminal/views ${terminal_all} ${host_libs} platform)
set(layer_folders host platform data skin chart grid controls addon views ${terminal_all})
set(plain_cxx data terminal/sim)

set(failures "")
set(checked 0)
foreach(folder ${layer_folders})
  set(allowed ${allow_${folder}})
  if(NOT IS_DIRECTORY ${MV_SOURCE_DIR}/${folder})
    list(APPEND failures "${folder}/: the folder is missing")
    continue()
  endif()
  file(GLOB_RECURSE files LIST_DIRECTORIES false
    ${MV_SOURCE_DIR}/${folder}/*.h ${MV_SOURCE_DIR}/${folder}/*.hpp
    ${MV_SOURCE_DIR}/${folder}/*.cpp ${MV_SOURCE_DIR}/${folder}/*.cc)
  foreach(file ${files})
    math(EXPR checked "${checked} + 1")
    file(RELATIVE_PATH rel ${MV_SOURCE_DIR} ${file})
    file(STRINGS ${file} lines REGEX "^[ \t]*#[ \t]*include")
    foreach(line ${lines})
      if(NOT line MATCHES "^[ \t]*#[ \t]*include[ \t]*[<\"]([^>\"]+)[>\"]")
        list(APPEND failures "${rel}: an include this check cannot read: ${line}")
        continue()
      endif()
      set(header "${CMAKE_MATCH_1}")
      if(header MATCHES "(^|/)\\.\\.(/|$)")
        list(APPEND failures "${rel}: \"${header}\" climbs out of its folder (name a header by its layer folder)")
        continue()
      endif()
      if(folder IN_LIST plain_cxx AND (header MATCHES "^Q[A-Za-z0-9_]+$" OR header MATCHES "^Qt[A-Za-z0-9]*/"
                                   OR header MATCHES "^q[a-z0-9_]+\\.h$"))
        list(APPEND failures "${rel}: <${header}> is Qt, and ${folder}/ is plain C++")
        continue()
      endif()
      # Which project folder does the header name?
      set(named "")
      foreach(candidate ${project_headers})
        string(LENGTH "${candidate}/" n)
        string(SUBSTRING "${header}" 0 ${n} head)
        if(head STREQUAL "${candidate}/")
          set(named ${candidate})
          break()
        endif()
      endforeach()
      if(NOT named AND header MATCHES "^terminal/")
        set(named terminal)  # terminal/ itself holds no headers
      endif()
      if(named AND NOT named IN_LIST allowed)
        list(APPEND failures "${rel}: \"${header}\" is in ${named}/, which ${folder}/ may not use")
      endif()
    endforeach()
  endforeach()
endforeach()

if(failures)
  list(LENGTH failures n)
  string(REPLACE ";" "\n  " text "${failures}")
  message(FATAL_ERROR "${n} include(s) break the layers (docs/architecture.md, Layers):\n  ${text}")
endif()
message(STATUS "layers: ${checked} files, every include within its layer")
