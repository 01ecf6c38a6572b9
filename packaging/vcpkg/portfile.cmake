# The port, for use in the root of the tree: vcpkg install ic --overlay-ports=packaging/vcpkg
#
# tests/package/recipes.py checks that the files and options named here exist. No test builds the port: vcpkg is not a
# Debian package.
get_filename_component(SOURCE_PATH "${CMAKE_CURRENT_LIST_DIR}/../.." ABSOLUTE)

vcpkg_cmake_configure(
    SOURCE_PATH "${SOURCE_PATH}"
    OPTIONS
        -DIC_BUILD_TESTS=OFF
        -DIC_BUILD_EXAMPLES=OFF -DIC_BUILD_TOOLS=OFF
        -DIC_INSTALL=ON)
vcpkg_cmake_install()
vcpkg_cmake_config_fixup(PACKAGE_NAME IC CONFIG_PATH lib/cmake/IC)
vcpkg_fixup_pkgconfig()

file(REMOVE_RECURSE "${CURRENT_PACKAGES_DIR}/debug/include" "${CURRENT_PACKAGES_DIR}/debug/share")
# The tree has no licence file; vcpkg requires a file.
vcpkg_install_copyright(FILE_LIST "${SOURCE_PATH}/README.md")
