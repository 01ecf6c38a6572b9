"""The recipe for Conan 2: `conan create packaging/conan` in the root of the tree.

tests/package/recipes.py checks that it is valid Python and that its version, description, options and files are those
of the tree. No test builds the package: Conan is not a Debian package.
"""

import os

from conan import ConanFile
from conan.tools.build import check_min_cppstd
from conan.tools.cmake import CMake, CMakeDeps, CMakeToolchain, cmake_layout
from conan.tools.files import copy, rmdir


class ICRecipe(ConanFile):
    name = "ic"
    version = "1.1.0"
    description = "C++17 library that models a machine as nodes with typed, numbered properties"
    package_type = "library"
    settings = "os", "arch", "compiler", "build_type"
    options = {"shared": [True, False], "platform_dir": ["", "ANY"]}
    default_options = {"shared": True, "platform_dir": ""}

    def export_sources(self):
        # The library without its tests, examples and benchmarks.
        root = os.path.join(self.recipe_folder, os.pardir, os.pardir)
        copy(self, "CMakeLists.txt", root, self.export_sources_folder)
        for folder in ("cmake", "include", "platform", "src", "testkit", "tools"):
            copy(self, os.path.join(folder, "*"), root, self.export_sources_folder)

    def validate(self):
        check_min_cppstd(self, 17)

    def layout(self):
        cmake_layout(self)

    def generate(self):
        toolchain = CMakeToolchain(self)
        toolchain.cache_variables["IC_BUILD_TESTS"] = False
        toolchain.cache_variables["IC_BUILD_EXAMPLES"] = False
        toolchain.cache_variables["IC_BUILD_TOOLS"] = False
        toolchain.cache_variables["IC_INSTALL"] = True
        toolchain.cache_variables["IC_PLATFORM_DIR"] = str(self.options.platform_dir)
        toolchain.generate()
        CMakeDeps(self).generate()

    def build(self):
        cmake = CMake(self)
        cmake.configure()
        cmake.build()

    def package(self):
        CMake(self).install()
        rmdir(self, os.path.join(self.package_folder, "lib", "pkgconfig"))  # Conan writes its own

    def package_info(self):
        # Users find the library's own CMake package, which also finds its platform.
        self.cpp_info.set_property("cmake_find_mode", "none")
        self.cpp_info.builddirs = [os.path.join("lib", "cmake", "IC")]
        self.cpp_info.set_property("pkg_config_name", "IC")
        self.cpp_info.libs = ["IC"]
        if self.options.platform_dir:
            platform = str(self.options.platform_dir)
            self.cpp_info.includedirs.append(os.path.join(platform, "include"))
            self.cpp_info.libdirs.append(os.path.join(platform, "lib"))
        self.cpp_info.libs += ["VXLog", "ZQ"]
