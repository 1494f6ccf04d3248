# The interop cases: seeded file pairs and their deltas made by xdelta3 at
# build time, so the Windows build decodes the same real xdelta3 output
# under Wine as the native build does.
set(vcdiff_cases_dir "${CMAKE_CURRENT_BINARY_DIR}/vcdiff-cases")
set(vcdiff_cases_script "${CMAKE_CURRENT_SOURCE_DIR}/patch/make_xdelta3_cases.py")
add_custom_command(
  OUTPUT "${vcdiff_cases_dir}/manifest.txt"
  COMMAND "${Python3_EXECUTABLE}" "${vcdiff_cases_script}" "${vcdiff_cases_dir}"
  DEPENDS "${vcdiff_cases_script}"
  COMMENT "Encoding the VCDIFF interop cases with xdelta3"
  VERBATIM)
add_custom_target(vcdiff_cases DEPENDS "${vcdiff_cases_dir}/manifest.txt")
add_dependencies(${target} vcdiff_cases)
target_compile_definitions(${target} PRIVATE VCDIFF_CASES_DIR="${vcdiff_cases_dir}")
