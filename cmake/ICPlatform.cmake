# IC::ZQ and IC::VXLog: the agent's own libraries below IC_PLATFORM_DIR. The build and the installed package use it.
foreach(name ZQ VXLog)
    if(TARGET IC::${name})
        continue()
    endif()
    # IC_PLATFORM_DIR is not below the root in which a toolchain file has libraries looked for.
    find_library(IC_PLATFORM_${name} ${name} PATHS ${IC_PLATFORM_DIR}/lib
                 NO_DEFAULT_PATH NO_CMAKE_FIND_ROOT_PATH NO_CACHE)
    if(NOT IC_PLATFORM_${name} OR NOT IS_DIRECTORY ${IC_PLATFORM_DIR}/include/${name})
        message(FATAL_ERROR "IC: no ${name} library in '${IC_PLATFORM_DIR}' (IC_PLATFORM_DIR): "
                            "lib/ must hold the library and include/${name}/ its headers")
    endif()
    add_library(IC::${name} UNKNOWN IMPORTED)
    set_target_properties(IC::${name} PROPERTIES
        IMPORTED_LOCATION ${IC_PLATFORM_${name}}
        INTERFACE_INCLUDE_DIRECTORIES ${IC_PLATFORM_DIR}/include)
endforeach()
