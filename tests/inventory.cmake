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

ic_add_test(inventory_changes inventory_parts)
add_dependencies(inventory_changes_test inventory)
target_compile_definitions(inventory_changes_test PRIVATE
    INVENTORY_PROGRAM="$<TARGET_FILE:inventory>" IC_TEST_TOPOLOGIES="${IC_TEST_TOPOLOGIES}")

# Python reads what the inventory writes.
find_package(Python3 COMPONENTS Interpreter)
set(manual ${PROJECT_SOURCE_DIR}/examples/inventory/ic-inventory.1)
if(Python3_Interpreter_FOUND AND TARGET inventory_without_json)
    ic_add_test(inventory_outputs inventory_parts)
    add_dependencies(inventory_outputs_test inventory inventory_without_json)
    target_compile_definitions(inventory_outputs_test PRIVATE
        INVENTORY_PROGRAM="$<TARGET_FILE:inventory>" IC_TEST_TOPOLOGIES="${IC_TEST_TOPOLOGIES}"
        INVENTORY_WITHOUT_JSON="$<TARGET_FILE:inventory_without_json>" INVENTORY_MANUAL="${manual}"
        PYTHON="${Python3_EXECUTABLE}")
else()
    message(STATUS "IC: what the inventory writes is not tested: the Debian package python3 or nlohmann-json3-dev"
                   " is missing")
endif()

# The manual page as both of its readers want it: neither has anything to say.
find_program(IC_MANDOC mandoc)
find_program(IC_MAN man)
if(IC_MANDOC AND IC_MAN)
    add_test(NAME inventory_manual_mandoc COMMAND ${IC_MANDOC} -T lint ${manual})
    add_test(NAME inventory_manual_man COMMAND sh -c
        "said=$(LC_ALL=C.UTF-8 MANROFFSEQ= MANWIDTH=80 '${IC_MAN}' --warnings -E UTF-8 -l -Tutf8 -Z '${manual}' 2>&1 >/dev/null) && echo \"$said\" && test -z \"$said\"")
else()
    message(STATUS "IC: the inventory's manual page is not tested: the Debian package mandoc or man-db is missing")
endif()

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
