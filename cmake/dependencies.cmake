# Third-party code is installed by scripts/setup.sh and built or linked here;
# none of it lives in the repository.

# The same folder scripts/setup.sh unpacks into: IRONVALE_DEPS_DIR from the
# environment, else its default.
if(DEFINED ENV{IRONVALE_DEPS_DIR} AND NOT "$ENV{IRONVALE_DEPS_DIR}" STREQUAL "")
  set(deps_dir_default "$ENV{IRONVALE_DEPS_DIR}")
else()
  set(deps_dir_default "/opt/ironvale-deps")
endif()
set(IRONVALE_DEPS_DIR "${deps_dir_default}" CACHE PATH "Sources unpacked by scripts/setup.sh")
set(IRONVALE_LZMA_SDK_DIR "/usr/include/lzma" CACHE PATH "LZMA SDK C sources (Debian lzma-dev)")

# LZMA SDK: the decoder goes into the program, the encoder into the tools
# and tests. Single-threaded match finder only.
add_library(ironvale_lzma_decoder STATIC "${IRONVALE_LZMA_SDK_DIR}/LzmaDec.c")
target_include_directories(ironvale_lzma_decoder SYSTEM PUBLIC "${IRONVALE_LZMA_SDK_DIR}")
add_library(ironvale_lzma_encoder STATIC "${IRONVALE_LZMA_SDK_DIR}/LzmaEnc.c" "${IRONVALE_LZMA_SDK_DIR}/LzFind.c")
target_include_directories(ironvale_lzma_encoder SYSTEM PUBLIC "${IRONVALE_LZMA_SDK_DIR}")
target_compile_definitions(ironvale_lzma_encoder PUBLIC _7ZIP_ST)

# TinyXML: Debian's library natively; Debian's patched source for Windows.
if(WIN32)
  set(tinyxml_dir "${IRONVALE_DEPS_DIR}/tinyxml")
  if(NOT EXISTS "${tinyxml_dir}/tinyxml.h")
    message(FATAL_ERROR "TinyXML source not found in ${tinyxml_dir}; run scripts/setup.sh")
  endif()
  add_library(ironvale_tinyxml STATIC
    "${tinyxml_dir}/tinyxml.cpp" "${tinyxml_dir}/tinystr.cpp"
    "${tinyxml_dir}/tinyxmlerror.cpp" "${tinyxml_dir}/tinyxmlparser.cpp")
  target_include_directories(ironvale_tinyxml SYSTEM PUBLIC "${tinyxml_dir}")
  target_compile_definitions(ironvale_tinyxml PUBLIC TIXML_USE_STL)
else()
  find_path(TINYXML_INCLUDE_DIR tinyxml.h REQUIRED)
  find_library(TINYXML_LIBRARY tinyxml REQUIRED)
  add_library(ironvale_tinyxml INTERFACE)
  target_include_directories(ironvale_tinyxml SYSTEM INTERFACE "${TINYXML_INCLUDE_DIR}")
  target_link_libraries(ironvale_tinyxml INTERFACE "${TINYXML_LIBRARY}")
  target_compile_definitions(ironvale_tinyxml INTERFACE TIXML_USE_STL)
endif()

# What every file of ours that includes windows.h must see alike; each folder
# library passes it on.
add_library(ironvale_platform INTERFACE)
if(WIN32)
  target_compile_definitions(ironvale_platform INTERFACE WIN32_LEAN_AND_MEAN NOMINMAX _WIN32_WINNT=0x0601)
else()
  find_package(CURL REQUIRED)
  find_package(OpenSSL REQUIRED)
  find_package(Threads REQUIRED)
endif()
