#!/usr/bin/env -S python3 -B
"""Compares what the Yocto layer and the RPM spec file say with the build and what it installs.

bitbake itself is not run. What is read here is the part of its language that the layer uses: each
line has to be one that this knows, so that a slip shows. The recipe's own step of the installation
runs, and the files are handed to its packages as bitbake does it.
Usage: recipes.py BUILD_DIRECTORY SOURCE_DIRECTORY
"""
import fnmatch
import pathlib
import re
import subprocess
import sys
import tempfile

build, source = map(pathlib.Path, sys.argv[1:])
layer = source / "packaging/yocto/meta-dhcp-client-provider"
failures = []


def check(holds, text):
    if not holds:
        failures.append(text)


def same(what, expected, found):
    for name in sorted(set(expected) - set(found)):
        failures.append(f"{what}: {name} is missing")
    for name in sorted(set(found) - set(expected)):
        failures.append(f"{what}: {name} is not expected")


def read(path):
    """The variables and functions of a file of bitbake's."""
    values, functions = {}, {}
    lines = iter(path.read_text().splitlines())
    for line in lines:
        if not line or line.startswith("#"):
            continue
        if line.startswith("inherit "):
            values["inherit"] = line.removeprefix("inherit ")
        elif match := re.fullmatch(r"(python )?([\w:${}.-]*) ?\(\) ?\{", line):
            body = []
            while (line := next(lines)) != "}":
                body.append(line)
            name = match[2] or "anonymous"
            check(name not in functions, f"{path.name}: {name}() is there twice")
            functions[name] = "\n".join(body)
        else:
            while line.endswith("\\"):
                line = line[:-1] + next(lines)
            match = re.fullmatch(r'([\w:${}.\[\]-]+) (=|\?=|\?\?=|\+=|\.=) "([^"]*)"', line)
            if not match:
                failures.append(f"{path.name}: what is this? {line}")
                continue
            check(match[1] not in values, f"{path.name}: {match[1]} is assigned twice")
            values[match[1]] = match[3]
    return values, functions


# What bitbake.conf sets, of what is used here.
directories = {
    "prefix": "/usr",
    "bindir": "/usr/bin",
    "libdir": "/usr/lib",
    "includedir": "/usr/include",
    "datadir": "/usr/share",
    "docdir": "/usr/share/doc",
    "mandir": "/usr/share/man",
    "sysconfdir": "/etc",
    "localstatedir": "/var",
    "systemd_system_unitdir": "/usr/lib/systemd/system",
    "PN": "dhcp-client-provider",
}


def expanded(text):
    return re.sub(r"\$\{(\w+)\}", lambda match: directories.get(match[1], match[0]), text)


# The layer.
values, functions = read(layer / "conf/layer.conf")
name = values["BBFILE_COLLECTIONS"]
for variable in ("BBFILE_PATTERN", "BBFILE_PRIORITY", "LAYERVERSION", "LAYERDEPENDS", "LAYERSERIES_COMPAT"):
    check(f"{variable}_{name}" in values, f"layer.conf: {variable}_{name} is missing")
check(values["BBPATH"] == ":${LAYERDIR}", "layer.conf: BBPATH does not have the layer")
pattern = values["BBFILES"].replace("${LAYERDIR}/", "")
recipes = [path for path in layer.rglob("*") if path.suffix in (".bb", ".bbappend")]
check(recipes == list(layer.glob(pattern)) and len(recipes) == 1, "layer.conf: BBFILES is not the recipe")
recipe = recipes[0]
values, functions = read(recipe)

cmake = (source / "CMakeLists.txt").read_text()
version = re.search(r"^project\(\S+ VERSION (\S+)", cmake, re.MULTILINE)[1]
check(recipe.name == f"dhcp-client-provider_{version}.bb", f"{recipe.name} is not of version {version}")
for name, body in functions.items():
    if name == "anonymous":
        compile("def anonymous(d):\n" + body, recipe.name, "exec")
    else:
        done = subprocess.run(["sh", "-n"], input=body, text=True, capture_output=True)
        check(done.returncode == 0, f"{recipe.name}: {name}(): {done.stderr}")

# What CMake looks for is what the recipe and the RPM packages ask for.
found = set()
for path in source.rglob("CMakeLists.txt"):
    below = path.relative_to(source).parts[0]
    if below in ("build", "tests", "bench", "fuzz"):
        continue
    for line in path.read_text().splitlines():
        if match := re.match(r" *pkg_check_modules\(\w+ REQUIRED (?:IMPORTED_TARGET )?([\w.+-]+)", line):
            found.add(match[1])
        elif match := re.match(r" *find_package\((\w+)", line):
            found.add(match[1])
# CMake's own, and what only tests and benchmarks need.
found -= {"PkgConfig", "Threads", "GTest", "benchmark"}
in_openembedded = {"CLI11": "cli11", "EXPAT": "expat", "gnutls": "gnutls", "libcrypt": "virtual/crypt",
                   "libcurl": "curl", "libmicrohttpd": "libmicrohttpd", "libmnl": "libmnl",
                   "libsystemd": "systemd", "nlohmann_json": "nlohmann-json", "zlib": "zlib"}
same("libraries that the recipe knows", found, in_openembedded)
depends = values["DEPENDS"].split()
flags = {match[1]: value for name, value in values.items()
         if (match := re.fullmatch(r"PACKAGECONFIG\[(.+)\]", name))}
for value in flags.values():
    depends += (value.split(",") + [""] * 3)[2].split()
same("DEPENDS", in_openembedded.values(), depends)
spec = (source / "packaging/rpm/dhcp-client-provider.spec").read_text()
asked = re.findall(r"^BuildRequires: +pkgconfig\(([\w.+-]+)\)", spec, re.MULTILINE)
same("BuildRequires", {name.replace("EXPAT", "expat") for name in found} | {"gmock", "gtest"}, asked)
for name in asked:
    check(subprocess.run(["pkg-config", "--exists", name]).returncode == 0,
          f"BuildRequires: pkg-config does not know {name}")

# Options are those of CMake; what can be left out is what the code knows.
options = re.findall(r"^(?:option|set)\((\w+) ", cmake, re.MULTILINE)
given = re.findall(r"-D(\w+)=", " ".join([values["EXTRA_OECMAKE"], *flags.values()]))
same("options of CMake", [], set(given) - set(options) - {"CMAKE_BUILD_TYPE"})
sources = values["READ_SOURCES"].split()
code = (source / "platform/zrcommon/include/zrcommon/BuiltSources.h").read_text()
same("READ_SOURCES", re.findall(r'"([^"]+)"', re.search(r"sources\{([^}]*)\}", code)[1]), sources)
same("PACKAGECONFIG", sources + ["small"], flags)

# The files and the packages that they come into.
components = {"gateway": "cmpi-dhcp-client", "provider": "cmpi-dhcp-client-provider",
              "neighbours": "cmpi-dhcp-client-neighbours", "schema": "dhcp-client-provider-schema",
              "cimdhcp": "cimdhcp", "dev": "dhcp-client-provider-dev"}
patterns = {"dhcp-client-provider-staticdev": ["/usr/lib/dhcp-client-provider/*.a"],
            "dhcp-client-provider-dev": ["/usr/include", "/usr/lib/lib*.so", "/usr/lib/cmake"],
            "dhcp-client-provider-doc": ["/usr/share/doc", "/usr/share/man"]}
own = expanded(values["PACKAGE_BEFORE_PN"]).split()
for package in own:
    key = next((key for key in values if expanded(key) == f"FILES:{package}"), None)
    patterns[package] = expanded(values[key]).split() if key else []
    check(patterns[package] or values.get(f"ALLOW_EMPTY:{package}") == "1", f"{package} has no files")
units = values["SYSTEMD_SERVICE:cimdhcp"].split()
check(values["SYSTEMD_AUTO_ENABLE"] == "disable", "services are not off")
patterns["cimdhcp"] += [f"{directories['systemd_system_unitdir']}/{unit}" for unit in units]


def is_of(path, pattern):
    return fnmatch.fnmatch(path, pattern) or path.startswith(pattern + "/")


def leaves(root):
    """Files, and directories that have none."""
    for path in pathlib.Path(root).rglob("*"):
        if path.is_symlink() or not path.is_dir() or not any(path.iterdir()):
            yield "/" + str(path.relative_to(root))


def installed(root, *arguments):
    subprocess.run(["cmake", "--install", str(build), "--prefix", "/usr", *arguments], check=True,
                   env={"PATH": "/usr/bin:/bin", "DESTDIR": str(root)}, stdout=subprocess.DEVNULL)
    # A build on Debian may have an architecture's directory.
    for directory in root.glob("usr/lib/*-linux-gnu*"):
        for path in list(directory.iterdir()):
            path.rename(directory.parent / path.name)
        directory.rmdir()
    return root


with tempfile.TemporaryDirectory() as scratch:
    root = installed(pathlib.Path(scratch) / "all")
    # Of the two places that a unit can have, the one that needs more to be done.
    environment = {"PATH": "/usr/bin:/bin", "D": str(root), **directories,
                   "systemd_system_unitdir": "/lib/systemd/system"}
    step = subprocess.run(["sh", "-eu"], input=functions["do_install:append"], text=True, env=environment,
                          capture_output=True)
    check(step.returncode == 0, f"do_install:append: {step.stderr}")
    patterns["cimdhcp"] = [path.replace("/usr/lib/systemd", "/lib/systemd") for path in patterns["cimdhcp"]]
    packaged, used = {}, set()
    for path in leaves(root):
        package, pattern = next(((package, pattern) for package, those in patterns.items()
                                 for pattern in those if is_of(path, pattern)), (None, None))
        check(package, f"{path} is in no package")
        packaged[path.replace("/lib/systemd", "/usr/lib/systemd")] = package
        used.add((package, pattern))
    same("FILES", [(package, pattern) for package in own for pattern in patterns[package]],
         [each for each in used if each[0] in own])
    for component, package in components.items():
        for path in leaves(installed(pathlib.Path(scratch) / component, "--component", component)):
            if packaged.get(path) not in (None, package, "dhcp-client-provider-doc",
                                          "dhcp-client-provider-staticdev"):
                failures.append(f"{path} is in {packaged[path]} in place of {package}")
    # What is run or kept is there.
    for name, text in {**functions, **values}.items():
        if name.startswith(("pkg_", "CONFFILES")):
            for path in re.findall(r"(?<![\w}])/(?:etc|usr)/[\w./-]+", expanded(text)):
                check(path in packaged, f"{name}: there is no {path}")

for failure in failures:
    print(failure)
sys.exit(bool(failures))
