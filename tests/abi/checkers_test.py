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

    def build(self, source, *options):
        library = str(self.root / "library.so")
        compiler = os.environ.get("CXX", "c++")
        subprocess.run([compiler, "-shared", "-fPIC", "-fvisibility=hidden", *options, "-o", library,
                        self.write("library.cpp", source)], check=True)
        return library

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

    def test_TreeWithOneWrongLineFails(self):
        backend, file = '#include "../port/backend/Backend.h"\n', '#include "../simulator/File.h"\n'
        self.write("port/include/port_facts.h", "")
        self.write("port/backend/Bad.h", "#include <toml++/toml.h>\n")
        for path, text, message in (
                ("src/Bad.cpp", backend, "port/backend/Backend.h lies below"),
                ("include/Bad.h", "# include <port_facts.h>\n", "port/include/port_facts.h lies below"),
                ("src/Bad.h", "#include <optional>\n", "<optional> is not for the library"),
                ("src/Bad.cpp", "#include <unistd.h>\n", "<unistd.h> is not for the library"),
                ("src/Bad.cpp", "#ifdef __linux__\n#endif\n", "asks the preprocessor for __linux__"),
                ("src/Bad.cpp", "  # if FOO > 1\n#endif\n", "asks the preprocessor for FOO"),
                ("src/Bad.cpp", "#elif defined(PORT)\n#endif\n", "asks the preprocessor for PORT"),
                ("port/api/bad.h", '#include "../backend/Backend.h"\n', "includes port/backend/Backend.h"),
                ("port/shim/bad.cpp", "#include <glib.h>\n", "a shim reaches <glib.h>"),
                ("port/shim/bad.cpp", '#include "../backend/Bad.h"\n', "a shim reaches <toml++/toml.h>"),
                ("port/shim/bad.cpp", "#include <openssl/evp.h>\n", "a shim reaches <openssl/evp.h>"),
                ("port/shim/bad.cpp", file, "a shim reaches port/simulator/File.h"),
                ("port/linux/bad.cpp", file, "reaches port/simulator/File.h"),
                ("port/simulator/bad.cpp", '#include "../linux/Bus.h"\n', "reaches port/linux/Bus.h"),
                ("devicefile/bad.cpp", '#include "../port/simulator/File.h"\n', "includes port/simulator/File.h"),
                ("cli/bad.cpp", '#include "../port/simulator/File.h"\n', "includes port/simulator/File.h")):
            with self.subTest(path=path, text=text):
                self.write(path, text)
                self.assert_fails(self.check(), f"{path}: {message}")
                (self.root / path).unlink()


class Symbols(CheckerTest):
    def setUp(self):
        super().setUp()
        self.exports = self.write("exports.txt", "# all\nExported::Ask(char const*)\n")
        self.list_imports("platform_call")

    def list_imports(self, symbols):
        self.imports = self.write("imports.txt", f"[all]\nsoname = liball.so.1\nsymbols = {symbols}\n")

    def check(self, source, *options, built_with=()):
        return self.run_checker("check_symbols.py", self.build(source, *built_with), *options)

    def check_lists(self, source=LIBRARY_SOURCE):
        return self.check(source, "--exports", self.exports, "--imports", self.imports,
                          "--runtime", str(HERE / "runtime.txt"))

    def test_GoodLibraryPasses(self):
        self.assert_passes(self.check_lists())

    def test_WhatIsNotListedFails(self):
        for source, message in (
                ('__attribute__((visibility("default"))) void leaked() {}', "exported but not in the list: leaked()"),
                ('extern "C" int more(); int user() { return more(); }', "imported but not in the list: more"),
                ('#include <cstdlib>\nchar* user() { return getenv("A"); }', "imported but not in the list: getenv@")):
            with self.subTest(message):
                self.assert_fails(self.check_lists(LIBRARY_SOURCE + source + "\n"), message)

    def test_WhatIsListedAndMissingFails(self):
        self.write("exports.txt", "Exported::Ask(char const*)\nExported::Gone()\n")
        self.list_imports("platform_call other_call")
        result = self.check_lists()
        self.assert_fails(result, "in the list but not exported: Exported::Gone()")
        self.assert_fails(result, "in the list but not imported: other_call")

    def test_ExportedInsideOfTheClassFailsAlsoWhenListed(self):
        names = ("CoreSystem::CoreSystem()", "CoreSystem::~CoreSystem()", "vtable for CoreSystem",
                 "typeinfo for CoreSystem", "typeinfo name for CoreSystem")
        self.write("exports.txt", "\n".join(names))
        self.list_imports("")
        result = self.check_lists("""struct __attribute__((visibility("default"))) CoreSystem {
                                         CoreSystem();
                                         virtual ~CoreSystem();
                                     };
                                     CoreSystem::CoreSystem() {}
                                     CoreSystem::~CoreSystem() {}""")
        for name in names:
            self.assert_fails(result, f"must never be exported: {name}")

    def check_vtables(self, longer=None):
        sources = [f"struct {name} {{ virtual ~{name}(); {'virtual void More() {}' if name == longer else ''} }};"
                   f"{name}::~{name}() {{}}\n" for name in SINGLETONS]
        return self.check("".join(sources), "--vtable", str(8 if sys.maxsize > 2**32 else 4))

    def test_VirtualTableHoldsALoneDestructor(self):
        self.assert_passes(self.check_vtables())
        for name in SINGLETONS:
            self.assert_fails(self.check_vtables(longer=name),
                              f"the virtual table of {name} holds 5 words, not the 4")
        self.assert_fails(self.check("int nothing;", "--vtable", "8"), "was not found")

    def test_LibraryThatSuitsNoDeviceFails(self):
        other = str(self.root / "libother.so.1")
        source = self.write("platform.c", "int platform_call(const char* key) { return !key; }")
        subprocess.run(["cc", "-shared", "-fPIC", "-Wl,-soname,libother.so.1", "-o", other, source], check=True)
        new = "#include <string>\nvoid user(std::string& text) { text.append(\"a\"); }\n"
        place = "looks for libraries in a place of its own: /here"
        for source, options, message in (
                ("", ["-Wl,--no-as-needed", other], "asked of the loader but not in the list: libother.so.1"),
                ("", [], "in the list but not asked of the loader: liball.so.1"),
                ("", ["-Wl,--enable-new-dtags,-rpath,/here"], place),
                ("", ["-Wl,--disable-new-dtags,-rpath,/here"], place),
                ("", ["-Wl,-z,lazy"], "not everything is bound at start"),
                ("", ["-Wl,-z,norelro"], "its table of addresses stays writable"),
                (new, [], "too new for a device: _ZNSt7__cxx11")):
            with self.subTest(message, options=options):
                bare = [] if source else ["-nostdlib"]
                self.assert_fails(self.check(source or LIBRARY_SOURCE, "--imports", self.imports, "--device",
                                             "--strings", "old", built_with=["-Wl,-z,now", *bare, *options]), message)


INTERFACE_SOURCE = """
#include <string>
#define API __attribute__((visibility("default")))
class Listener {
public:
    virtual void OnFirst(int state) = 0;
    virtual void OnSecond(bool enabled) = 0;
    virtual ~Listener() {}
};
class Library {
public:
    API static Library* GetInstance();
    API bool IsEnough(double megabytes);
    API void SetListener(Listener* listener);
private:
    int count_ = 0;
};
Library* Library::GetInstance() { static Library instance; return &instance; }
bool Library::IsEnough(double megabytes) { return megabytes > ++count_; }
void Library::SetListener(Listener* listener) { listener->OnSecond(true); }
"""


class Baseline(CheckerTest):
    """An interface that was changed in one place, against the one before."""

    def setUp(self):
        super().setUp()
        self.baseline = str(self.root / "library.abi")
        self.assert_passes(self.check("", "", "--refresh"))

    def check(self, before, after, *options):
        self.assertIn(before, INTERFACE_SOURCE)
        # clang leaves out of a library's debug information what it takes to be in another one's.
        whole = ["-fstandalone-debug"] if "clang" in os.environ.get("CXX", "") else []
        library = self.build(INTERFACE_SOURCE.replace(before, after), "-g", *whole)
        return self.run_checker("check_baseline.py", library, self.baseline, *options)

    def assert_told(self, result, *messages):
        for message in messages + ("--refresh", ):
            self.assert_fails(result, message)

    def test_SameInterfacePasses(self):
        self.assert_passes(self.check("", ""))

    def test_RecordedBaselineHoldsNoFolder(self):
        self.assertNotIn(str(self.root), pathlib.Path(self.baseline).read_text())

    def test_RemovedMethodIsNamed(self):
        self.assert_told(self.check("API bool IsEnough", "bool IsEnough"),
                         "Removed function", "Library::IsEnough(double)")

    def test_OtherOrderOfTheListenerIsNamed(self):
        first, second = "virtual void OnFirst(int state) = 0;", "virtual void OnSecond(bool enabled) = 0;"
        self.assert_told(self.check(f"{first}\n    {second}", f"{second}\n    {first}"),
                         "Listener::OnFirst(int)", "vtable")


if __name__ == "__main__":
    unittest.main()
