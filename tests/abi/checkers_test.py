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
        self.runtime = str(HERE / "runtime.txt")

    def list_imports(self, symbols):
        self.imports = self.write("imports.txt", f"[all]\nsoname = liball.so.1\nsymbols = {symbols}\n")

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
        self.list_imports("platform_call other_call")
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
        self.list_imports("")
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

    def check_device(self, *options):
        return self.run_checker("check_symbols.py",
                                self.build(LIBRARY_SOURCE, "-Wl,-z,now", "-nostdlib", *options),
                                "--imports", self.imports, "--device", "--strings", "old")

    def platform_library(self, soname):
        path = str(self.root / soname)
        source = self.write("platform.c", "int platform_call(const char* key) { return !key; }")
        subprocess.run(["cc", "-shared", "-fPIC", f"-Wl,-soname,{soname}", "-o", path, source],
                       check=True)
        return path

    def test_LibraryOfTheWrongNameFails(self):
        other = self.platform_library("libother.so.1")
        self.assert_fails(self.check_device("-Wl,--no-as-needed", other), "asked of the loader but not in the list: libother.so.1")

    def test_LibraryThatNobodyAsksForFails(self):
        self.assert_fails(self.check_device(), "in the list but not asked of the loader: liball.so.1")

    def test_PlaceOfItsOwnFails(self):
        for option in ("--enable-new-dtags", "--disable-new-dtags"):
            self.assert_fails(self.check_device(f"-Wl,{option},-rpath,/here"),
                              "looks for libraries in a place of its own: /here")

    def test_LateBindingFails(self):
        self.assert_fails(self.check_device("-Wl,-z,lazy"), "not everything is bound at start")

    def test_NewRuntimeFails(self):
        source = "#include <string>\nvoid user(std::string& text) { text.append(\"a\"); }\n"
        self.assert_fails(self.run_checker("check_symbols.py", self.build(source), "--device",
                                           "--strings", "old", "--imports", self.imports),
                          "too new for a device: _ZNSt7__cxx11")


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
