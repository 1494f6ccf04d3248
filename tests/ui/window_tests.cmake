# The Windows program's main window, boxes and language dialog under Wine
# and Xvfb: window_driver shows them as the update run will, window_probe
# and dialog_answer play the player, and the scripts check what the X
# server shows.
if(WIN32)
  set(programs "${PROJECT_SOURCE_DIR}/tests/support/programs")
  add_executable(window_driver "${programs}/window_driver.cpp")
  target_link_libraries(window_driver PRIVATE ironvale_ui)
  ironvale_link_resources(window_driver)
  ironvale_warnings(window_driver)

  add_executable(window_probe "${programs}/window_probe.cpp")
  target_link_libraries(window_probe PRIVATE user32)
  target_link_options(window_probe PRIVATE -municode)
  ironvale_warnings(window_probe)

  set(wine_programs $<TARGET_FILE:IronvaleUpdater> $<TARGET_FILE:hold_instance> $<TARGET_FILE:window_driver>
                    $<TARGET_FILE:window_probe> $<TARGET_FILE:dialog_answer>)
  foreach(name window dialogs)
    add_test(NAME ui_${name}_wine COMMAND bash "${CMAKE_CURRENT_SOURCE_DIR}/ui/${name}_wine.sh" ${wine_programs})
    # Each takes its own X display, but they share the Wine prefix (and
    # its registry) with the start-up tests.
    set_tests_properties(ui_${name}_wine PROPERTIES LABELS script TIMEOUT 300 RUN_SERIAL TRUE)
  endforeach()
endif()
