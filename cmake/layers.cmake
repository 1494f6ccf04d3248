# Every product folder is one static library that links only folders below
# it. The calls of these two functions are also the include rules:
# scripts/check_includes.py reads them and refuses a file that includes a
# header of a folder its call does not name, a named folder that no file
# includes, and a named folder that is not below.

# ironvale_folder_library(FOLDER [FOLDER_IT_INCLUDES ...]): the library
# ironvale_<folder, '/' as '_'> from the folder's sources for this platform.
# Entry points (main*.cpp) are left to the programs.
function(ironvale_folder_library folder)
  ironvale_collect_sources(sources ${folder})
  list(FILTER sources EXCLUDE REGEX "/main(_win|_posix)?\\.cpp$")
  ironvale_folder_target(target ${folder})
  add_library(${target} STATIC ${sources})
  target_include_directories(${target} PUBLIC "${PROJECT_SOURCE_DIR}")
  target_link_libraries(${target} PUBLIC ironvale_platform)
  foreach(dependency IN LISTS ARGN)
    ironvale_folder_target(linked ${dependency})
    target_link_libraries(${target} PUBLIC ${linked})
  endforeach()
  ironvale_warnings(${target})
endfunction()

# ironvale_folder_program(TARGET FOLDER [FOLDER_IT_INCLUDES ...]): a program
# made of every source of FOLDER.
function(ironvale_folder_program name folder)
  ironvale_collect_sources(sources ${folder})
  add_executable(${name} ${sources})
  foreach(dependency IN LISTS ARGN)
    ironvale_folder_target(linked ${dependency})
    target_link_libraries(${name} PRIVATE ${linked})
  endforeach()
  ironvale_link_resources(${name})
  ironvale_warnings(${name})
endfunction()

function(ironvale_folder_target out folder)
  string(REPLACE "/" "_" name "${folder}")
  set(${out} ironvale_${name} PARENT_SCOPE)
endfunction()
