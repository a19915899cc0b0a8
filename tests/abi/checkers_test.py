#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""The checkers against trees and libraries that are wrong in one thing each."""
import os
import pathlib
import subprocess
import sys
import tempfile
import unittest

HERE = pathlib.Path(__file__).resolve().parent

SINGLETONS = ("CoreSystem", "SimManager", "ConnectionManager", "DBusManager")

LIBRARY_SOURCE = """
extern "C" int platform_call(const char*);
struct __attribute__((visibility("default"))) Exported {
    int Ask(const char* key);
};
int Exported::Ask(const char* key) { return platform_call(key); }
"""


class CheckerTest(unittest.TestCase):
    def setUp(self):
        folder = tempfile.TemporaryDirectory()
        self.addCleanup(folder.cleanup)
        self.root = pathlib.Path(folder.name)

    def write(self, name, text):
        path = self.root / name
        path.parent.mkdir(parents=True, exist_ok=True)
        path.write_text(text)
        return str(path)

    def run_checker(self, checker, *arguments):
        done = subprocess.run([sys.executable, str(HERE / checker), *arguments],
                              capture_output=True, text=True)
        self.assertEqual("", done.stderr)
        return done.returncode, done.stdout

    def assert_fails(self, result, message):
        code, output = result
        self.assertIn(message, output)
        self.assertEqual(1, code)

    def assert_passes(self, result):
        self.assertEqual(0, result[0], result[1])


class Layers(CheckerTest):
    def setUp(self):
        super().setUp()
        self.write("include/Public.h", "#ifndef CORESYSTEM_PUBLIC_H\n#include <string>\n#endif\n")
        self.write("src/Library.cpp",
                   "#include \"Public.h\"\n#include <platform_call.h>\n#include <Util.h>\n")
        self.write("port/api/platform_call.h", "#include <stdbool.h>\n")
        self.write("port/coreutil/include/Util.h", "#include <string>\n")
        self.write("port/backend/Backend.h", "#include <optional>\n")
        self.write("port/shim/call.cpp", "#include \"../backend/Backend.h\"\n")
        self.write("port/linux/Bus.h", "#include <gio/gio.h>\n")
        self.write("port/linux/Linux.cpp", "#include \"Bus.h\"\n#include \"../backend/Backend.h\"\n")
        self.write("port/simulator/File.h", "#include <toml++/toml.h>\n")
        self.write("port/simulator/Simulator.cpp", "#include \"File.h\"\n")

    def check(self):
        return self.run_checker("check_layers.py", str(self.root))

    def test_GoodTreePasses(self):
        self.assert_passes(self.check())

    def test_LibraryIncludingTheBackendFails(self):
        self.write("src/Bad.cpp", "#include \"../port/backend/Backend.h\"\n")
        self.assert_fails(self.check(), "src/Bad.cpp: port/backend/Backend.h lies below")

    def test_LibraryIncludingThePortsOwnHeaderFails(self):
        self.write("port/include/port_facts.h", "")
        self.write("include/Bad.h", "# include <port_facts.h>\n")
        self.assert_fails(self.check(), "include/Bad.h: port/include/port_facts.h lies below")

    def test_LibraryIncludingALaterStandardHeaderFails(self):
        self.write("src/Bad.h", "#include <optional>\n")
        self.assert_fails(self.check(), "src/Bad.h: <optional> is not for the library")

    def test_LibraryIncludingASystemHeaderFails(self):
        self.write("src/Bad.cpp", "#include <unistd.h>\n")
        self.assert_fails(self.check(), "src/Bad.cpp: <unistd.h> is not for the library")

    def test_LibraryAskingForThePlatformFails(self):
        for line, macro in (("#ifdef __linux__", "__linux__"), ("  # if FOO > 1", "FOO"),
                            ("#elif defined(CORESYSTEM_PORT)", "CORESYSTEM_PORT")):
            self.write("src/Bad.cpp", f"{line}\n#endif\n")
            self.assert_fails(self.check(), f"src/Bad.cpp: asks the preprocessor for {macro}")

    def test_PlatformHeaderIncludingTheBackendFails(self):
        self.write("port/api/bad.h", "#include \"../backend/Backend.h\"\n")
        self.assert_fails(self.check(), "port/api/bad.h: includes port/backend/Backend.h")

    def test_ShimReachingGLibFails(self):
        self.write("port/shim/bad.cpp", "#include <glib.h>\n")
        self.assert_fails(self.check(), "port/shim/bad.cpp: a shim reaches <glib.h>")

    def test_ShimReachingTomlThroughAHeaderFails(self):
        self.write("port/backend/Bad.h", "#include <toml++/toml.h>\n")
        self.write("port/shim/bad.cpp", "#include \"../backend/Bad.h\"\n")
        self.assert_fails(self.check(), "port/shim/bad.cpp: a shim reaches <toml++/toml.h>")

    def test_ShimReachingOpenSslFails(self):
        self.write("port/shim/bad.cpp", "#include <openssl/evp.h>\n")
        self.assert_fails(self.check(), "port/shim/bad.cpp: a shim reaches <openssl/evp.h>")

    def test_ShimReachingABackendsInsideFails(self):
        self.write("port/shim/bad.cpp", "#include \"../simulator/File.h\"\n")
        self.assert_fails(self.check(), "port/shim/bad.cpp: a shim reaches port/simulator/File.h")

    def test_BackendsReachingEachOtherFail(self):
        self.write("port/linux/bad.cpp", "#include \"../simulator/File.h\"\n")
        self.assert_fails(self.check(), "port/linux/bad.cpp: reaches port/simulator/File.h")
        self.write("port/simulator/bad.cpp", "#include \"../linux/Bus.h\"\n")
        self.assert_fails(self.check(), "port/simulator/bad.cpp: reaches port/linux/Bus.h")


class Symbols(CheckerTest):
    def setUp(self):
        super().setUp()
        self.exports = self.write("exports.txt", "# all\nExported::Ask(char const*)\n")
        self.imports = self.write("imports.txt", "platform_call\n")
        self.runtime = str(HERE / "runtime.txt")

    def build(self, source):
        library = str(self.root / "library.so")
        compiler = os.environ.get("CXX", "c++")
        subprocess.run([compiler, "-shared", "-fPIC", "-fvisibility=hidden", "-o", library,
                        self.write("library.cpp", source)], check=True)
        return library

    def check_lists(self, source):
        return self.run_checker("check_symbols.py", self.build(source), "--exports", self.exports,
                                "--imports", self.imports, "--runtime", self.runtime)

    def lone_destructor(self, name):
        return f"struct {name} {{ virtual ~{name}(); }}; {name}::~{name}() {{}}\n"

    def check_vtable(self, source):
        return self.run_checker("check_symbols.py", self.build(source), "--vtable",
                                str(8 if sys.maxsize > 2**32 else 4))

    def test_GoodLibraryPasses(self):
        self.assert_passes(self.check_lists(LIBRARY_SOURCE))

    def test_NewExportFails(self):
        source = LIBRARY_SOURCE + "__attribute__((visibility(\"default\"))) void leaked() {}\n"
        self.assert_fails(self.check_lists(source), "exported but not in the list: leaked()")

    def test_MissingExportFails(self):
        self.write("exports.txt", "Exported::Ask(char const*)\nExported::Gone()\n")
        self.assert_fails(self.check_lists(LIBRARY_SOURCE),
                          "in the list but not exported: Exported::Gone()")

    def test_NewPlatformCallFails(self):
        source = LIBRARY_SOURCE + "extern \"C\" int more(); int user() { return more(); }\n"
        self.assert_fails(self.check_lists(source), "imported but not in the list: more")

    def test_MissingPlatformCallFails(self):
        self.write("imports.txt", "platform_call\nother_call\n")
        self.assert_fails(self.check_lists(LIBRARY_SOURCE),
                          "in the list but not imported: other_call")

    def test_ReadingTheEnvironmentFails(self):
        source = LIBRARY_SOURCE + "#include <cstdlib>\nchar* user() { return getenv(\"A\"); }\n"
        self.assert_fails(self.check_lists(source), "imported but not in the list: getenv@")

    def test_ExportedInsideOfTheClassFailsAlsoWhenListed(self):
        source = """struct __attribute__((visibility("default"))) CoreSystem {
                        CoreSystem();
                        virtual ~CoreSystem();
                    };
                    CoreSystem::CoreSystem() {}
                    CoreSystem::~CoreSystem() {}"""
        names = ("CoreSystem::CoreSystem()", "CoreSystem::~CoreSystem()", "vtable for CoreSystem",
                 "typeinfo for CoreSystem", "typeinfo name for CoreSystem")
        self.write("exports.txt", "\n".join(names))
        self.write("imports.txt", "")
        result = self.check_lists(source)
        for name in names:
            self.assert_fails(result, f"must never be exported: {name}")

    def test_VirtualTableOfALoneDestructorPasses(self):
        self.assert_passes(self.check_vtable("".join(map(self.lone_destructor, SINGLETONS))))

    def test_OneMoreVirtualMethodFails(self):
        for name in SINGLETONS:
            others = "".join(self.lone_destructor(other) for other in SINGLETONS if other != name)
            self.assert_fails(
                self.check_vtable(others + f"""
                    struct {name} {{ virtual ~{name}(); virtual void More(); }};
                    {name}::~{name}() {{}}
                    void {name}::More() {{}}"""),
                f"the virtual table of {name} holds 5 words, not the 4")

    def test_NoVirtualTableAtAllFails(self):
        self.assert_fails(self.check_vtable("int nothing;"), "was not found")


if __name__ == "__main__":
    unittest.main()
