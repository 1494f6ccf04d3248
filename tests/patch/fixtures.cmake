# The VCDIFF interop cases, made by xdelta3 at build time so that the Windows
# build decodes under Wine the same real xdelta3 output as the native one.
set(vcdiff_cases_dir "${CMAKE_CURRENT_BINARY_DIR}/vcdiff-cases")
add_custom_command(
  OUTPUT "${vcdiff_cases_dir}/manifest.txt"
  COMMAND "${Python3_EXECUTABLE}" "${CMAKE_CURRENT_SOURCE_DIR}/patch/make_xdelta3_cases.py" "${vcdiff_cases_dir}"
  DEPENDS "${CMAKE_CURRENT_SOURCE_DIR}/patch/make_xdelta3_cases.py"
  COMMENT "Encoding the VCDIFF interop cases with xdelta3"
  VERBATIM)
add_custom_target(vcdiff_cases DEPENDS "${vcdiff_cases_dir}/manifest.txt")
add_dependencies(${target} vcdiff_cases)
target_compile_definitions(${target} PRIVATE VCDIFF_CASES_DIR="${vcdiff_cases_dir}")
