# The example that is the library's main job: its parts, and the program itself.
set(default_topologies ${PROJECT_SOURCE_DIR}/../shared/data/hwloc)
if(NOT IS_DIRECTORY ${default_topologies})
    set(default_topologies "")
endif()
set(IC_TEST_TOPOLOGIES "${default_topologies}" CACHE PATH
    "Folder with hwloc exports of real machines; empty: the tests that read them are skipped")

ic_add_test(inventory inventory_parts IC::VXLog)
add_dependencies(inventory_test inventory)
target_compile_definitions(inventory_test PRIVATE
    INVENTORY_PROGRAM="$<TARGET_FILE:inventory>" IC_TEST_TOPOLOGIES="${IC_TEST_TOPOLOGIES}")

# umockdev shows a program sensors that the machine has not.
find_program(IC_UMOCKDEV_RUN umockdev-run)
if(IC_UMOCKDEV_RUN)
    ic_add_test(inventory_sensors)
    add_dependencies(inventory_sensors_test inventory)
    target_compile_definitions(inventory_sensors_test PRIVATE
        INVENTORY_PROGRAM="$<TARGET_FILE:inventory>" UMOCKDEV_RUN="${IC_UMOCKDEV_RUN}")
else()
    message(STATUS "IC: the inventory's sensors are not tested: the Debian package umockdev is missing")
endif()
