# What the tests of the simulated unit need on top of the other process tests; without the program they are empty.
if(TARGET btsvc-sim)
  target_sources(process_tests PRIVATE ${CMAKE_CURRENT_LIST_DIR}/sim_unit.cpp)
  target_compile_definitions(process_tests PRIVATE
    BTSVC_SIM_PATH="$<TARGET_FILE:btsvc-sim>" BTSVC_SCENARIOS="${PROJECT_SOURCE_DIR}/examples/scenarios")
  target_include_directories(process_tests PRIVATE ${PROJECT_SOURCE_DIR}/tools)
  add_dependencies(process_tests btsvc-sim)
endif()
