#!/usr/bin/python3
"""Checks the recipes for Conan and vcpkg without running either: recipes.py ROOT-OF-THE-TREE

They must be valid Python and JSON, have the version and the description of the tree, and name only files and options
that exist.
"""

import ast
import json
import os
import py_compile
import re
import sys
import tempfile

root = sys.argv[1]
faults = []


def read(*path):
    with open(os.path.join(root, *path), encoding="utf-8") as file:
        return file.read()


def expect(condition, fault):
    if not condition:
        faults.append(fault)


cmake = read("CMakeLists.txt")
version = re.search(r"project\(IC VERSION ([0-9.]+)", cmake).group(1)
description = re.search(r'DESCRIPTION "([^"]+)"', cmake).group(1)
options = set(re.findall(r"^(?:option|set)\((IC_\w+)", cmake, re.MULTILINE))


def expect_options(recipe, text):
    named = set(re.findall(r"(?:\b|-D)(IC_\w+)", text))
    expect(named, f"{recipe} names no option")
    for option in sorted(named - options):
        faults.append(f"{recipe} names the option {option}, which does not exist")


# Conan
conanfile = os.path.join(root, "packaging", "conan", "conanfile.py")
with tempfile.TemporaryDirectory() as folder:
    try:
        py_compile.compile(conanfile, cfile=os.path.join(folder, "conanfile.pyc"), doraise=True)
    except py_compile.PyCompileError as error:
        sys.exit(f"conanfile.py is not valid: {error}")
text = read("packaging", "conan", "conanfile.py")
recipe = next(node for node in ast.parse(text).body if isinstance(node, ast.ClassDef))
fields = {
    node.targets[0].id: node.value.value
    for node in recipe.body
    if isinstance(node, ast.Assign) and isinstance(node.value, ast.Constant)
}
expect(fields.get("version") == version, f"conanfile.py has the version {fields.get('version')}, not {version}")
expect(fields.get("description") == description, "conanfile.py has another description than CMakeLists.txt")
expect_options("conanfile.py", text)
folders = re.search(r"for folder in \(([^)]*)\)", text)
expect(folders is not None, "conanfile.py exports no folder")
for folder in re.findall(r'"(\w+)"', folders.group(1) if folders else ""):
    expect(os.path.isdir(os.path.join(root, folder)), f"conanfile.py exports {folder}/, which does not exist")
# The folders that a build without tests, examples and benchmarks reads.
named = re.findall(r"(?:add_subdirectory\(|_SOURCE_DIR\}/|include\()(\w+)", cmake + read("cmake", "CMakeLists.txt"))
for part in sorted(set(named) - {"tests", "examples", "benchmarks"}):
    if os.path.isdir(os.path.join(root, part)):
        expect(folders and f'"{part}"' in folders.group(1), f"conanfile.py does not export {part}/")

# vcpkg
try:
    port = json.loads(read("packaging", "vcpkg", "vcpkg.json"))
except json.JSONDecodeError as error:
    sys.exit(f"vcpkg.json is not valid: {error}")
expect(port.get("version") == version, f"vcpkg.json has the version {port.get('version')}, not {version}")
expect(port.get("description") == description, "vcpkg.json has another description than CMakeLists.txt")
portfile = read("packaging", "vcpkg", "portfile.cmake")
expect_options("portfile.cmake", portfile)
for file in re.findall(r"\$\{SOURCE_PATH\}/([\w./]+)", portfile):
    expect(os.path.exists(os.path.join(root, file)), f"portfile.cmake names {file}, which does not exist")

for fault in faults:
    print(fault, file=sys.stderr)
sys.exit(1 if faults else 0)
