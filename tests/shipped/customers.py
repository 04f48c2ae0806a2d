#!/usr/bin/env python3
# SPDX-License-Identifier: MIT
"""Installs a build into a folder, moves the folder, and lets customers of the installed files build and run there.

    customers.py --build FOLDER --source FOLDER --work FOLDER --compiler FILE [--windows --toolchain FILE --runner FILE]

On Linux: the examples by find_package, one program by pkg-config, the Python examples, two panels on the sample machine, and vx
itself. For Windows: the examples by
find_package and the toolchain, one program each by pkg-config, by the import library, and by a library made of the .def. Exit
status 1 with the words of whatever failed.
"""

import argparse
import os
import pathlib
import shutil
import subprocess
import sys
import tempfile

LINUX_FILES = [
    "bin/vx", "bin/vxreg", "lib/libVXCOMN64U.so", "lib/SampleEngine.so", "lib/SampleEngine.DSP.HiFi2.so",
    "lib/cmake/vxcomn/vxcomn-config.cmake", "lib/cmake/vxcomn/vxcomn-config-version.cmake", "lib/pkgconfig/vxcomn.pc",
    "include/VXDSPAPI.h", "include/vxcomn/engine.h", "share/man/man1/vx.1", "share/man/man1/vxreg.1",
    "share/bash-completion/completions/vx", "share/doc/vxcomn/README.md", "share/doc/vxcomn/docs/architecture.md",
]
WINDOWS_FILES = [
    "bin/vx.exe", "bin/vxreg.exe", "bin/VXCOMN64U.dll", "bin/SampleEngine.dll", "lib/libVXCOMN64U.dll.a", "lib/VXCOMN64U.def",
    "lib/cmake/vxcomn/vxcomn-config.cmake", "lib/pkgconfig/vxcomn.pc", "include/VXDSPAPI.h", "share/doc/vxcomn/README.md",
]
LINES = 40
PROGRAM = """#include <VXDSPAPI.h>
#include <stdio.h>
int main(void) {
    VXHandle host = VXDSPAPI_InitializeLibrary("SampleEngine", 0, 0, 0, 0, 48000, 0);
    puts(host ? "the engine is there" : "no engine");
    return host && VXDSPAPI_FreeLibrary(host) ? 0 : 1;
}
"""


class Customers:
    def __init__(self, options, work):
        self.windows = options.windows
        self.options = options
        self.work = work
        self.source = pathlib.Path(options.source).resolve()
        self.prefix = work / "moved here"  # with a space, as in real life
        self.ending = ".exe" if self.windows else ""
        # A root of its own for what stands in for the machine; the linker's and Python's usual ways to find things stay shut.
        self.environment = dict(os.environ, VXCOMN_ROOT=str(work / "machine"), PKG_CONFIG_LIBDIR=str(self.prefix / "lib/pkgconfig"))
        for name in ("DESTDIR", "LD_LIBRARY_PATH", "CMAKE_PREFIX_PATH", "PKG_CONFIG_PATH", "CMAKE_GENERATOR"):
            self.environment.pop(name, None)

    def run(self, *command, **more):
        command = [str(word) for word in command]
        result = subprocess.run(command, capture_output=True, text=True, env={**self.environment, **more.pop("env", {})}, **more)
        if result.returncode != 0:
            sys.exit(f"{' '.join(command)}\nended with status {result.returncode}\n{result.stdout}{result.stderr}")
        return result.stdout

    def start(self, program, *arguments, **more):
        """Runs a built program, a Windows one through Wine and with the DLLs beside it."""
        return self.run(*([self.options.runner] if self.windows else []), program, *arguments, **more)

    def install(self):
        first = self.work / "first"
        self.run("cmake", "--install", self.options.build, "--prefix", first)
        first.rename(self.prefix)
        missing = [name for name in (WINDOWS_FILES if self.windows else LINUX_FILES) if not (self.prefix / name).exists()]
        if missing:
            sys.exit(f"not installed: {' '.join(missing)}")
        for path in self.prefix.rglob("*"):
            if path.suffix in (".cmake", ".pc") and str(first) in path.read_text(encoding="utf-8"):
                sys.exit(f"{path}: names the folder of the first installation")

    def tools(self):
        shown = self.start(self.prefix / f"bin/vx{self.ending}", "--version")
        print("installed vx:", shown.strip())
        self.start(self.prefix / f"bin/vx{self.ending}", "signal", "--help")

    def place(self, folder):
        """What a Windows program finds beside itself; on Linux the run path does."""
        if self.windows:
            for library in (self.prefix / "bin").glob("*.dll"):
                shutil.copy(library, folder)

    def lengths(self):
        """An example is to be read at a glance."""
        for path in sorted((self.source / "examples").iterdir()):
            if path.suffix in (".c", ".cpp", ".py") and len(path.read_text(encoding="utf-8").splitlines()) > LINES:
                sys.exit(f"{path}: has more than {LINES} lines")

    def find_package(self):
        built = self.work / "examples"
        toolchain = [f"-DCMAKE_TOOLCHAIN_FILE={self.options.toolchain}"] if self.windows else []
        root = [f"-DCMAKE_FIND_ROOT_PATH={self.prefix}"] if self.windows else []
        self.run("cmake", "-S", self.source / "examples", "-B", built, "-G", "Ninja", "-DCMAKE_BUILD_TYPE=Release",
                 f"-DCMAKE_PREFIX_PATH={self.prefix}", *toolchain, *root)
        self.run("cmake", "--build", built)
        self.place(built)
        print("find_package:", self.start(built / f"apo_host{self.ending}").strip())
        quiet = self.start(built / f"apo_host{self.ending}", "GainEngine")
        if "0.250" not in quiet:
            sys.exit(f"the gain engine at 1 changed the sine: {quiet}")
        print("the C engine:", quiet.strip())
        if self.windows:
            # No endpoint of the product under Wine: the panel says so.
            panel = subprocess.run([self.options.runner, str(built / "control_panel.exe"), "99"], capture_output=True, text=True,
                                   env=self.environment)
            if panel.returncode != 3 or "no such endpoint: error -15" not in panel.stderr:
                sys.exit(f"the control panel without an endpoint ended with {panel.returncode}: {panel.stdout}{panel.stderr}")
            print("control panel:", panel.stderr.strip().splitlines()[-1])

    def build_and_run(self, how, *link):
        folder = self.work / how.replace(" ", "_")
        folder.mkdir()
        source = folder / "program.c"
        source.write_text(PROGRAM, encoding="utf-8")
        program = folder / f"program{self.ending}"
        self.run(self.options.compiler, "-std=c11", "-Wall", "-Werror", source, "-o", program, *link)
        self.place(folder)
        print(f"{how}:", self.start(program, cwd=folder).strip())

    def by_pkg_config(self):
        # pkg-config writes for a shell: a space in a path comes with a backslash.
        flags = self.run("pkg-config", "--cflags", "--libs", "vxcomn")
        words = self.run("sh", "-c", f"printf '%s\\n' {flags.strip()}").splitlines()
        path = [] if self.windows else [f"-Wl,-rpath,{self.prefix / 'lib'}"]
        self.build_and_run("pkg-config", *words, *path)

    def by_windows_libraries(self):
        include = f"-I{self.prefix / 'include'}"
        self.build_and_run("import library", include, self.prefix / "lib/libVXCOMN64U.dll.a")
        made = self.work / "made_of_the_def.a"
        self.run("x86_64-w64-mingw32-dlltool", "-d", self.prefix / "lib/VXCOMN64U.def", "-l", made)
        self.build_and_run("library of the def", include, made)

    def by_python(self):
        library = self.prefix / "lib/libVXCOMN64U.so"
        shown = self.run(sys.executable, self.source / "examples/tuning_spectrum.py", library).strip().splitlines()
        raised = float(next(line.split()[2] for line in shown if line.split()[0] == "1000.0"))
        if not 6 < raised < 12:
            sys.exit("\n".join(["the equaliser's band does not show in the spectrum:", *shown]))
        print("Python: 1 kHz was raised by", raised, "dB")

    def by_panels(self):
        """One process watches the sample machine's speakers while another moves a slider."""
        os.makedirs(self.environment["VXCOMN_ROOT"], exist_ok=True)
        self.run("sh", self.prefix / "share/doc/vxcomn/examples/sample_machine/install.sh",
                 env={"VX": str(self.prefix / "bin/vx"), "VXREG": str(self.prefix / "bin/vxreg")})
        command = [sys.executable, self.source / "examples/panel_watch.py", self.prefix / "lib/libVXCOMN64U.so", "0", "1"]
        with subprocess.Popen(command, stdout=subprocess.PIPE, text=True, env=self.environment) as watcher:
            first = watcher.stdout.readline()
            moved = self.start(self.work / "examples/control_panel", "0", "0.25")
            told = watcher.communicate(timeout=300)[0]
        if first != "watching\n" or "-> 0.250" not in moved or "bass 0.250" not in told:
            sys.exit(f"the panels do not agree: {first}{moved}{told}")
        print("panels:", moved.strip(), "| told:", told.strip())


def main():
    parser = argparse.ArgumentParser()
    for name in ("--build", "--source", "--work", "--compiler"):
        parser.add_argument(name, required=True)
    parser.add_argument("--windows", action="store_true")
    parser.add_argument("--toolchain")
    parser.add_argument("--runner")
    options = parser.parse_args()
    os.makedirs(options.work, exist_ok=True)
    with tempfile.TemporaryDirectory(dir=options.work, prefix="customers-") as work:
        customers = Customers(options, pathlib.Path(work).resolve())
        customers.install()
        customers.tools()
        customers.lengths()
        customers.find_package()
        customers.by_pkg_config()
        if customers.windows:
            customers.by_windows_libraries()
        else:
            customers.by_python()
            customers.by_panels()
    print("all customers build and run")


main()
