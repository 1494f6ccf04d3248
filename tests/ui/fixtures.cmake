# The Windows program's main window, boxes and fonts under Wine and Xvfb:
# window_driver shows them as the update run will and plays the player at
# them, and the script checks what the X server shows.
if(WIN32)
  add_executable(window_driver "${PROJECT_SOURCE_DIR}/tests/support/programs/window_driver_win.cpp")
  target_link_libraries(window_driver PRIVATE ironvale_ui ironvale_state)
  ironvale_link_resources(window_driver)
  ironvale_warnings(window_driver)
  add_test(NAME ui_window_wine COMMAND bash "${CMAKE_CURRENT_SOURCE_DIR}/ui/window_wine.sh" $<TARGET_FILE:IronvaleUpdater>
                                       $<TARGET_FILE:hold_instance> $<TARGET_FILE:dialog_answer> $<TARGET_FILE:window_driver>)
  # It shares the Wine prefix (and its registry) with the scenarios.
  set_tests_properties(ui_window_wine PROPERTIES LABELS script TIMEOUT 300 RUN_SERIAL TRUE)
endif()
