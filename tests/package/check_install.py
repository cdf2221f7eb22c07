#!/usr/bin/env python3
"""Checks this build as it is installed (`installed`) or packaged (`packages`).

installed: `cmake --install` into a scratch prefix; the module and its stub must lie in the
  folder where the system interpreter's layout puts modules of that prefix, the installed
  binaries must load only installed libraries, and the module must loop values back.
packages: `cpack -G DEB`; every package's name, version, dependencies and files are checked with
  dpkg-deb, then all are unpacked with `dpkg-deb -x` and the tool and the module run from there.
"""
import argparse
import glob
import gzip
import os
import shutil
import subprocess
import sys
import sysconfig

# Writes a byte through the demo design's loopback (outputs come back on the inputs of the same
# number) and reads it back, from whatever zinmox module PYTHONPATH leads to.
LOOPBACK = """
import sys, zinmox
assert zinmox.__file__.startswith(sys.argv[1]), zinmox.__file__
assert zinmox.__version__ == sys.argv[2], zinmox.__version__
with zinmox.Session() as session:
    core = session.core("0:1:0").init()
    core.define("leds", "async_out", list(range(8)))
    core.define("leds_in", "async_in", list(range(8)))
    core.write(leds=0xA5)
    assert core.read()["leds_in"].value == 0xA5
print("loopback ok")
"""


def run(cmd, env=None, **kw):
    result = subprocess.run(cmd, env=env, stdout=subprocess.PIPE, stderr=subprocess.STDOUT,
                            text=True, **kw)
    if result.returncode != 0:
        sys.exit("FAILED (%d): %s\n%s" % (result.returncode, " ".join(cmd), result.stdout))
    return result.stdout


def check(condition, message):
    if not condition:
        sys.exit("FAILED: " + message)


def check_loads_from(binary, root):
    """Every libZin* library that the binary loads comes from below root."""
    for line in run(["ldd", binary]).splitlines():
        if "libZin" in line:
            check("=> " + root in line, "%s loads %s from outside %s" % (binary, line.strip(), root))


def check_python(python_dir, version):
    env = dict(os.environ, PYTHONPATH=python_dir, PYTHONDONTWRITEBYTECODE="1")
    check(os.path.isfile(os.path.join(python_dir, "zinmox.pyi")), "no zinmox.pyi in " + python_dir)
    modules = glob.glob(os.path.join(python_dir, "zinmox*.so"))
    check(len(modules) == 1, "expected one zinmox module in %s: %s" % (python_dir, modules))
    print(run([sys.executable, "-c", LOOPBACK, python_dir, version], env=env).strip())
    return modules[0]


def system_module_dir(prefix):
    """The folder where the system interpreter's layout keeps modules of this prefix."""
    scheme = "deb_system" if "deb_system" in sysconfig.get_scheme_names() else "posix_prefix"
    return sysconfig.get_path("platlib", scheme, vars={"base": prefix, "platbase": prefix})


def installed(args):
    prefix = os.path.join(args.work_dir, "prefix")
    run(["cmake", "--install", args.build_dir, "--config", args.config, "--prefix", prefix])
    python_dir = os.path.join(prefix, args.python_dir)
    check(os.path.realpath(python_dir) == os.path.realpath(system_module_dir(prefix)),
          "module folder %s is not the interpreter's %s" % (python_dir, system_module_dir(prefix)))
    module = check_python(python_dir, args.version)
    check_loads_from(module, prefix)
    tool = os.path.join(prefix, "bin", "zinmox")
    check_loads_from(tool, prefix)
    check(run([tool, "--version"]).strip() == "zinmox " + args.version, "tool version")


def deb_field(deb, field):
    return run(["dpkg-deb", "-f", deb, field]).strip()


def deb_files(deb):
    """The paths of the files and links in a package (folders left out)."""
    files = set()
    for line in run(["dpkg-deb", "-c", deb]).splitlines():
        mode, _owner, _size, _date, _time, rest = line.split(maxsplit=5)
        if not mode.startswith("d"):
            files.add(rest.split(" -> ")[0].lstrip("."))
    return files


def expected_files(libdir, python_dir, version):
    lib = "/usr/" + libdir
    fw = lib + "/zinmox-framework"
    so = lambda folder, name: {"%s/lib%s.so.%s" % (folder, name, v)
                               for v in (version.split(".")[0], version)}
    return {
        "libzinmox-framework": so(fw, "ZinUtil") | so(fw, "ZinJtag") | so(fw, "ZinCore"),
        "libzinmox1": so(lib, "ZinMOX") | so(lib, "ZinSim") | so(lib, "ZinNet"),
        "libzinmox-framework-dev": {fw + "/libZinCore.so", fw + "/libZinJtag.so",
                                    fw + "/libZinUtil.so",
                                    "/usr/include/zinmox-framework/ZinRT/ZinJtag.h",
                                    "/usr/include/zinmox-framework/ZinRT/Zin_Transport.h",
                                    lib + "/pkgconfig/zinmox-framework.pc"},
        "libzinmox-dev": {lib + "/libZinMOX.so", lib + "/libZinSim.so", lib + "/libZinNet.so",
                          "/usr/include/ZinMOX/ZinMOX.h", "/usr/include/ZinMOX/ZinMOX_Version.h",
                          "/usr/include/ZinNet/ZinNet.h", "/usr/include/ZinSim/Target.h",
                          lib + "/cmake/ZinMOX/ZinMOXConfig.cmake",
                          lib + "/cmake/ZinMOX/ZinMOXTargets.cmake", lib + "/pkgconfig/zinmox.pc"},
        "zinmox": {"/usr/bin/zinmox", "/usr/share/man/man1/zinmox.1.gz"},
        "python3-zinmox": {"/usr/%s/zinmox.pyi" % python_dir,
                           "/usr/%s/zinmox%s" % (python_dir,
                                                 sysconfig.get_config_var("EXT_SUFFIX"))},
    }


# Packages whose list of files is complete above; the -dev packages hold at least theirs.
EXACT = {"libzinmox-framework", "libzinmox1", "zinmox", "python3-zinmox"}


def check_depends(fields, version):
    same = "(= %s)" % version
    runtime = fields["libzinmox1"]
    for name in ("libzinmox1", "libzinmox-framework", "zinmox", "python3-zinmox"):
        depends = fields[name]["Depends"]
        check("libc6" in depends and "libstdc++6" in depends, name + " lacks libc6/libstdc++6: " +
              depends)
        check("libzinmox-framework" not in depends, name + " must only recommend the stand-ins")
    check(runtime["Recommends"] == "libzinmox-framework " + same, "libzinmox1 Recommends")
    for name in ("zinmox", "python3-zinmox"):
        check("libzinmox1 " + same in fields[name]["Depends"], name + " needs libzinmox1 " + same)
    check("python3 (>= 3." in fields["python3-zinmox"]["Depends"], "python3-zinmox needs python3")
    check(fields["libzinmox-dev"]["Depends"] ==
          "libzinmox1 %s, libzinmox-framework-dev %s" % (same, same), "libzinmox-dev Depends")
    check(fields["libzinmox-framework-dev"]["Depends"] == "libzinmox-framework " + same,
          "libzinmox-framework-dev Depends")


def check_contents(debs, args):
    expected = expected_files(args.libdir, args.python_dir, args.version)
    owner = {}
    for name, deb in debs.items():
        files = deb_files(deb)
        missing = expected[name] - files
        check(not missing, "%s lacks %s" % (name, sorted(missing)))
        extra = files - expected[name]
        check(name not in EXACT or not extra, "%s holds more: %s" % (name, sorted(extra)))
        for path in files:
            check(path not in owner, "%s is in %s and %s" % (path, owner.get(path), name))
            owner[path] = name
    fw_files = {p for p, n in owner.items() if "zinmox-framework" in p}
    check(all(owner[p].startswith("libzinmox-framework") for p in fw_files),
          "a stand-in file outside the framework packages")


def packages(args):
    out = os.path.join(args.work_dir, "out")
    run(["cpack", "-G", "DEB", "-C", args.config, "-B", out,
         "--config", os.path.join(args.build_dir, "CPackConfig.cmake")])
    debs = {deb_field(d, "Package"): d for d in glob.glob(os.path.join(out, "*.deb"))}
    check(set(debs) == set(expected_files("", "", "1")), "packages: %s" % sorted(debs))
    fields = {}
    for name, deb in debs.items():
        fields[name] = {f: deb_field(deb, f) for f in ("Version", "Depends", "Recommends")}
        check(fields[name]["Version"] == args.version, name + " version " + fields[name]["Version"])
    check_depends(fields, args.version)
    check_contents(debs, args)

    root = os.path.join(args.work_dir, "root")
    for deb in debs.values():
        run(["dpkg-deb", "-x", deb, root])
    tool = os.path.join(root, "usr", "bin", "zinmox")
    check_loads_from(tool, root)
    check(run([tool, "--version"]).strip() == "zinmox " + args.version, "tool version")
    check("0:1:0" in run([tool, "demo"]), "zinmox demo printed no core")
    with gzip.open(os.path.join(root, "usr/share/man/man1/zinmox.1.gz"), "rt") as man:
        page = man.read()
    check(".TH ZINMOX" in page and args.version in page and "serve" in page, "manual page")
    module = check_python(os.path.join(root, "usr", args.python_dir), args.version)
    check_loads_from(module, root)


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("mode", choices=["installed", "packages"])
    for option in ("--build-dir", "--work-dir", "--version", "--libdir", "--python-dir",
                   "--config"):
        parser.add_argument(option, required=True)
    args = parser.parse_args()
    shutil.rmtree(args.work_dir, ignore_errors=True)
    installed(args) if args.mode == "installed" else packages(args)
    print(args.mode + " ok")


if __name__ == "__main__":
    main()
