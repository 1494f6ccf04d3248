# The program's resources. The string table is built from the translators'
# UTF-8 file into the UTF-16 bytes the program reads; Windows gets a real
# .rc, POSIX the same bytes compiled in.

set(IRONVALE_STRING_TABLE "${CMAKE_CURRENT_BINARY_DIR}/resources/strings.csv")
add_custom_command(
  OUTPUT "${IRONVALE_STRING_TABLE}"
  COMMAND ${CMAKE_COMMAND} -E make_directory "${CMAKE_CURRENT_BINARY_DIR}/resources"
  COMMAND Python3::Interpreter "${PROJECT_SOURCE_DIR}/cmake/make_string_table.py"
          "${PROJECT_SOURCE_DIR}/resources/strings.tsv" "${IRONVALE_STRING_TABLE}"
  DEPENDS "${PROJECT_SOURCE_DIR}/resources/strings.tsv" "${PROJECT_SOURCE_DIR}/cmake/make_string_table.py"
  COMMENT "Building the string table")
# Resource libraries of other folders wait for the table through this.
add_custom_target(ironvale_string_table DEPENDS "${IRONVALE_STRING_TABLE}")

if(WIN32)
  enable_language(RC)
  # The main window draws its texts in a font of its own: DejaVu Sans Bold
  # from Debian's fonts-dejavu-core, copied in at build time, never kept in
  # the repository.
  set(IRONVALE_FONT_FILE /usr/share/fonts/truetype/dejavu/DejaVuSans-Bold.ttf)
  if(NOT EXISTS "${IRONVALE_FONT_FILE}")
    message(FATAL_ERROR "DejaVuSans-Bold.ttf not found: install fonts-dejavu-core (scripts/setup.sh)")
  endif()
  set(embedded_font "${CMAKE_CURRENT_BINARY_DIR}/resources/embedded_font.ttf")
  configure_file("${IRONVALE_FONT_FILE}" "${embedded_font}" COPYONLY)
  file(GLOB pictures "${PROJECT_SOURCE_DIR}/resources/pictures/*.png")
  set(IRONVALE_RC_FILE "${PROJECT_SOURCE_DIR}/resources/ironvale.rc")
  set_source_files_properties("${IRONVALE_RC_FILE}" PROPERTIES
    OBJECT_DEPENDS "${IRONVALE_STRING_TABLE};${PROJECT_SOURCE_DIR}/resources/ironvale.ico;${PROJECT_SOURCE_DIR}/resources/IronvaleUpdater.manifest;${PROJECT_SOURCE_DIR}/resources/resource_ids.h;${embedded_font};${pictures}")
  # windres finds the generated table through the include path.
  set(CMAKE_RC_FLAGS "${CMAKE_RC_FLAGS} -I${CMAKE_CURRENT_BINARY_DIR}/resources -I${PROJECT_SOURCE_DIR}/resources")
endif()

# ironvale_resource_library(NAME [PUBLIC_KEYS]): the resources as an object
# library. Every resource the program reads by name on both platforms is
# listed here as name, type, file; the pictures, the font and the dialog
# serve only the window of the Windows program and go into its .rc alone.
# With key files (a list: a signature by any of them counts, so a publisher
# can replace a key), the publisher's public keys go in, one after the
# other, as IDR_PUBLIC_KEY, and the program then requires signatures.
function(ironvale_resource_library name)
  set(keys "${ARGV1}")
  set(named IDS_STRINGS CSV "${IRONVALE_STRING_TABLE}")
  # windres loses the quotes of a file name passed in a definition, so the
  # keys are joined into a fixed name in a folder of this library.
  set(key_dir "${CMAKE_CURRENT_BINARY_DIR}/${name}")
  if(keys)
    add_custom_command(
      OUTPUT "${key_dir}/public_key.pem"
      COMMAND ${CMAKE_COMMAND} -P "${PROJECT_SOURCE_DIR}/cmake/join_keys.cmake" "${key_dir}/public_key.pem" ${keys}
      DEPENDS ${keys} "${PROJECT_SOURCE_DIR}/cmake/join_keys.cmake"
      COMMENT "Joining the publisher keys for ${name}")
    list(APPEND named IDR_PUBLIC_KEY PEM "${key_dir}/public_key.pem")
  endif()
  if(WIN32)
    add_library(${name} OBJECT "${IRONVALE_RC_FILE}")
    if(keys)
      set_property(SOURCE "${IRONVALE_RC_FILE}" APPEND PROPERTY OBJECT_DEPENDS "${key_dir}/public_key.pem")
      target_compile_definitions(${name} PRIVATE IRONVALE_PUBLIC_KEY)
      target_include_directories(${name} BEFORE PRIVATE "${key_dir}")
    endif()
  else()
    set(embedded "${CMAKE_CURRENT_BINARY_DIR}/resources/${name}.cpp")
    set(files)
    list(LENGTH named count)
    math(EXPR last "${count} - 1")
    foreach(index RANGE 2 ${last} 3)
      list(GET named ${index} file)
      list(APPEND files "${file}")
    endforeach()
    add_custom_command(
      OUTPUT "${embedded}"
      COMMAND ${CMAKE_COMMAND} -E make_directory "${CMAKE_CURRENT_BINARY_DIR}/resources"
      COMMAND Python3::Interpreter "${PROJECT_SOURCE_DIR}/cmake/embed_resources.py" "${embedded}" ${named}
      DEPENDS ${files} "${PROJECT_SOURCE_DIR}/cmake/embed_resources.py"
      COMMENT "Embedding resources")
    add_library(${name} OBJECT "${embedded}")
    target_include_directories(${name} PRIVATE "${PROJECT_SOURCE_DIR}")
  endif()
  add_dependencies(${name} ironvale_string_table)
endfunction()

# Every program but the product itself is built without a publisher key,
# so the tests' own servers need not sign.
ironvale_resource_library(ironvale_resources)
if(IRONVALE_PUBLIC_KEY)
  foreach(key IN LISTS IRONVALE_PUBLIC_KEY)
    if(NOT EXISTS "${key}")
      message(FATAL_ERROR "IRONVALE_PUBLIC_KEY: no file ${key} (make one with ironvale-patch keygen)")
    endif()
    file(READ "${key}" public_key_text)
    if(NOT public_key_text MATCHES "-----BEGIN PUBLIC KEY-----")
      message(FATAL_ERROR "IRONVALE_PUBLIC_KEY: ${key} holds no PEM public key")
    endif()
  endforeach()
  ironvale_resource_library(ironvale_product_resources "${IRONVALE_PUBLIC_KEY}")
else()
  add_library(ironvale_product_resources ALIAS ironvale_resources)
endif()

# Resources are found by name at run time, never referenced by a symbol, so
# a static library would drop them: every program links them directly.
function(ironvale_link_resources target)
  target_link_libraries(${target} PRIVATE ironvale_resources)
endfunction()
