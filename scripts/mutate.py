#!/usr/bin/env python3
"""Measures the power of the test suite with a fixed list of single-line faults.

Each fault replaces one exact snippet of one source file. The script copies the repository's
tracked files into a scratch folder, configures it once (preset "default", with ccache), and
then for each fault: applies it, rebuilds only the targets its tests need, runs the matching
tests with ctest and restores the file. A fault that the tests do not catch survives, and any
survivor fails the run. A snippet that is not found exactly once also fails the run at once,
before anything is built: the list must follow the code when it moves.

Run by hand (it is not part of the default test run), e.g.
    scripts/mutate.py                    # every fault
    scripts/mutate.py --list             # the faults, without running anything
    scripts/mutate.py --only lock,digit  # the faults whose name contains one of the words
"""

import argparse
import dataclasses
import os
import shutil
import subprocess
import sys
import time
from pathlib import Path

ROOT = Path(__file__).resolve().parent.parent

# Test selections (ctest regular expressions) and the targets that build them.
MOX = r"^(CallFrame|StatusRead|Ports|PortBits|SignalTable|WriteValues|ReadValues|Arrays|BitFormat)\."
MOX_TARGETS = ["zin_mox_tests"]
SIM = r"^(ModelTest|ModelLargeCore|ModelThreads|Description)\."
SIM_TARGETS = ["zin_sim_tests"]
TOOL = r"^(HostText|ClientCases|ErrorPaths|Script|JsonOutput|Demo)\."
TOOL_TARGETS = ["zinmox_tool_tests", "zinmox"]
PYTHON = r"^python_"
PYTHON_TARGETS = ["zinmox_python", "zinmox"]


@dataclasses.dataclass
class Fault:
    name: str
    path: str
    original: str
    replacement: str
    tests: str = MOX
    targets: list = dataclasses.field(default_factory=lambda: list(MOX_TARGETS))


FAULTS = [
    # --- the library -------------------------------------------------------------------------
    Fault("bit index: value bit i read from bit i%7 of its byte",
          "src/ZinMOX/signals/ZinMOX_SignalGroup.cpp",
          "return ((bytes[bit / 8] >> (bit % 8)) & 1u) != 0;",
          "return ((bytes[bit / 8] >> (bit % 7)) & 1u) != 0;"),
    Fault("activity swap: async activity up and down read from each other's places",
          "src/ZinMOX/command/ZinMOX_Command.cpp",
          "asyncInActivityUpBits.data(),\n                          asyncInActivityDownBits.data()}",
          "asyncInActivityDownBits.data(),\n                          asyncInActivityUpBits.data()}"),
    Fault("activity swap: sync activity up and sync-down read from each other's places",
          "src/ZinMOX/command/ZinMOX_Command.cpp",
          "syncInSyncActivityUpBits.data(),\n                          syncInSyncActivityDownBits.data()}",
          "syncInSyncActivityDownBits.data(),\n                          syncInSyncActivityUpBits.data()}"),
    Fault("activity swap: the activity_up and activity_down texts reported under each other's keys",
          "src/ZinMOX/values/ZinMOX_ReadValues.cpp",
          '"", ".value", ".activity_up", ".activity_down",',
          '"", ".value", ".activity_down", ".activity_up",'),
    Fault("read plan: an input defined after a read is not reported",
          "src/ZinMOX/core/ZinMOX_SignalTables.cpp",
          "group.release();\n  parts->readPlanStale = true;", "group.release();"),
    Fault("read plan: an undefined input is still reported",
          "src/ZinMOX/core/ZinMOX_SignalTables.cpp",
          "delete group;\n  parts->readPlanStale = true;", "delete group;"),
    Fault("fill: a converted range that takes fill digits filled with 0 instead of F",
          "src/ZinMOX/values/ZinMOX_HexText.cpp", "std::memset(text, fitted.fill, fills);",
          "std::memset(text, '0', fills);"),
    Fault("write plan: every checked entry staged into the first entry's group",
          "src/ZinMOX/values/ZinMOX_WriteValues.cpp", "    ++staged;\n", "\n"),
    Fault("scratch: converted bytes or-ed into those of the previous value",
          "src/ZinUtil/Zin_ByteBufferBits.cpp", "  out.resize(0);\n  out.resize(count / 2 + count % 2);",
          "  out.resize(count / 2 + count % 2);"),
    Fault("step order: step vectors of steps 0..7 taken in reverse",
          "src/ZinMOX/command/ZinMOX_StepVectors.cpp",
          "early |= uint64_t{vectors[t][byte]} << (8 * t);",
          "early |= uint64_t{vectors[7 - t][byte]} << (8 * t);"),
    Fault("held level: every byte of a run of synchronous outputs held at the first byte's value",
          "src/ZinMOX/command/ZinMOX_StepVectors.cpp",
          "_mm_set1_epi8(static_cast<char>(value[byte]))",
          "_mm_set1_epi8(static_cast<char>(value[0]))"),
    Fault("step order: the next step vector is taken one step late",
          "src/ZinMOX/signals/ZinMOX_SignalGroup.cpp",
          "if (step + 1 < stepCount) vector += bytes;",
          "if (step != 0 && step < stepCount) vector += bytes;"),
    Fault("update mark: async outputs staged without their mark",
          "src/ZinMOX/signals/ZinMOX_SignalGroup.cpp",
          "command->setAsyncOutUpdateChar(positions[i], '1');",
          "command->setAsyncOutUpdateChar(positions[i], '0');"),
    Fault("update mark: sync marks not cleared between writes",
          "src/ZinMOX/command/ZinMOX_Command.cpp",
          "syncOutUpdateBits.assign(syncOutUpdateBits.size(), '0');",
          "(void)0;"),
    Fault("argument check: a port count below the width accepted",
          "src/ZinMOX/api/ZinMOX_PortCalls.cpp",
          "checkArgument(count == physical || count == 0, function, condition);",
          "checkArgument(count <= physical, function, condition);"),
    Fault("argument check: a null update mask of the sync port accepted",
          "src/ZinMOX/api/ZinMOX_PortCalls.cpp",
          'checkArgument(!sync || syncOutUpdateMask != nullptr, fn, "syncOutUpdateMask!=0");',
          'checkArgument(!sync || syncOutData != nullptr, fn, "syncOutUpdateMask!=0");'),
    Fault("digit order: a long hex text keeps its first digits",
          "src/ZinMOX/values/ZinMOX_HexText.cpp",
          "text + (length - std::min(length, digits))", "text"),
    Fault("input order: eight synchronous inputs of the read data unpacked from the wrong end",
          "src/ZinMOX/command/ZinMOX_Command.cpp",
          "gatherEverySixth(word >> (top - k));\n      std::memcpy(fields[k] + i, mox::kByteBitsMsbFirst",
          "gatherEverySixth(word >> (top - k));\n      std::memcpy(fields[k] + i, mox::kByteBitsLsbFirst"),
    Fault("step order: the hex writer takes the late half of a step string first",
          "src/ZinMOX/format/ZinMOX_BitFormat.h",
          "(bitWordMsbFirst(early) << 8) | bitWordMsbFirst(late);",
          "(bitWordMsbFirst(late) << 8) | bitWordMsbFirst(early);"),
    Fault("digit order: the hex writer takes the second half of a sixteen-character block first",
          "src/ZinMOX/format/ZinMOX_BitFormat.h",
          "std::memcpy(next_, kFirstBitHighDigits[ones & 0xFF].data(), 2);",
          "std::memcpy(next_, kFirstBitHighDigits[ones >> 8].data(), 2);"),
    Fault("sign extension: digit 8 taken as positive",
          "src/ZinMOX/values/ZinMOX_HexText.cpp",
          "parseHexString(first) >= 8 ? 'F' : '0';",
          "parseHexString(first) > 8 ? 'F' : '0';"),
    Fault("padding: the read line's data not rounded to whole bytes",
          "src/ZinMOX/command/ZinMOX_Command.cpp",
          "*readBitCount = 8 * mox::byteCount(length) + 8;",
          "*readBitCount = length + 8;"),
    Fault("layout: the version key summed instead of ORed",
          "src/ZinMOX/core/ZinMOX_CoreStatus.cpp",
          "const uint32_t key = (coreInfo.coreMajorVersion << 4) | coreInfo.coreMinorVersion;",
          "const uint32_t key = (coreInfo.coreMajorVersion << 4) + coreInfo.coreMinorVersion;"),
    Fault("layout: the sixteen-bit layout from key 0x61",
          "src/ZinMOX/core/ZinMOX_CoreStatus.cpp",
          "constexpr uint32_t FIRST_KEY_OF_101_LAYOUT = 0x62;",
          "constexpr uint32_t FIRST_KEY_OF_101_LAYOUT = 0x61;"),
    Fault("abort: a text that starts with the abort text is taken as the abort",
          "src/ZinMOX/api/ZinMOX_CallFrame.cpp",
          "std::strcmp(text, ABORT_TEXT) == 0;",
          "std::strncmp(text, ABORT_TEXT, 9) == 0;"),
    Fault("suffix: the key split at its last dot",
          "src/ZinMOX/values/ZinMOX_WriteValues.cpp",
          "const size_t dot = whole.find('.');", "const size_t dot = whole.rfind('.');"),
    Fault("burst: any burst mode but 0 taken as burst",
          "src/ZinMOX/values/ZinMOX_WriteValues.cpp",
          "const bool burst = burstMode == 1;", "const bool burst = burstMode != 0;"),
    # --- the framework stand-ins and the scripted target ----------------------------------------
    Fault("lock: any thread re-enters a held target lock",
          "src/ZinJtag/ZinJtag_TargetLock.cpp",
          "if (s.depth != 0 && s.owner == self) {", "if (s.depth != 0) {"),
    Fault("odd status bit count: the framework keeps the bits above the count",
          "src/ZinCore/Zin_CoreComm.cpp",
          "bytes[whole] &= static_cast<unsigned char>((1u << (bitCount % 8)) - 1);",
          "bytes[whole] &= static_cast<unsigned char>((1u << (bitCount % 8)) | 0xFF);"),
    Fault("odd status bit count: the scripted target gives the bits above the count",
          "src/ZinTestKit/ScriptedTransport.cpp",
          "status[count - 1] &= static_cast<unsigned char>((1u << (statusBitCount % 8)) - 1);",
          "status[count - 1] &= static_cast<unsigned char>((1u << (statusBitCount % 8)) | 0xFF);"),
    # --- the simulator ------------------------------------------------------------------------
    Fault("sim update mark: async outputs committed without their mark",
          "src/ZinSim/MoxModel.cpp",
          "if (stagedAsyncUpdate_[i]) asyncOut_[i] = stagedAsyncValue_[i];",
          "asyncOut_[i] = stagedAsyncValue_[i];", SIM, SIM_TARGETS),
    Fault("sim step order: a pulse train starts one cycle early",
          "src/ZinSim/MoxModel.cpp",
          "if (t <= committed) return levelBefore_[bit] != 0;",
          "if (t < committed) return levelBefore_[bit] != 0;", SIM, SIM_TARGETS),
    Fault("sim activity swap: async activity up read out as down",
          "src/ZinSim/MoxModel.cpp",
          "put(4 * i + 1, in.up);", "put(4 * i + 1, in.down);", SIM, SIM_TARGETS),
    Fault("sim activity swap: sync activity latched the wrong way",
          "src/ZinSim/MoxInputs.cpp",
          "if (in.level != in.sample) (in.level ? in.syncUp : in.syncDown) = 1;",
          "if (in.level != in.sample) (in.level ? in.syncDown : in.syncUp) = 1;", SIM,
          SIM_TARGETS),
    Fault("sim digit order: data digits read from the wrong end",
          "src/ZinSim/HexNumber.cpp",
          "const uint64_t lowBit = 4 * static_cast<uint64_t>(text.size() - 1 - pos);",
          "const uint64_t lowBit = 4 * static_cast<uint64_t>(pos);", SIM, SIM_TARGETS),
    Fault("sim argument check: a read line expects read flag 0",
          "src/ZinSim/CommandParser.cpp",
          "const char expected = cmd.code >= kRead ? '1' : '0';",
          "const char expected = cmd.code > kRead ? '1' : '0';", SIM, SIM_TARGETS),
    Fault("sim clear: a read that lets no time pass clears only activity up",
          "src/ZinSim/MoxModel.cpp",
          "for (Input& in : asyncIn_) in.up = in.down = 0;",
          "for (Input& in : asyncIn_) in.up = 0;", SIM, SIM_TARGETS),
    Fault("sim clear: the clock edge after a read clears only activity up",
          "src/ZinSim/MoxInputs.cpp",
          "for (Input& in : asyncIn_) in.up = in.down = 0;",
          "for (Input& in : asyncIn_) in.up = 0;", SIM, SIM_TARGETS),
    # --- the host library of the tool and the Python module, and the module itself ------------
    Fault("host bit list: a list exactly as wide as the port refused",
          "src/ZinHost/BitList.cpp",
          "if (bits_.size() + count > maxBits_) {",
          "if (bits_.size() + count >= maxBits_) {", TOOL, TOOL_TARGETS),
    Fault("host digit order: a whole-port hex vector read from its first digit",
          "src/ZinHost/ValueText.cpp",
          "const unsigned value = digitValue(digits[digitCount - 1 - d]);",
          "const unsigned value = digitValue(digits[d]);", TOOL, TOOL_TARGETS),
    Fault("host sign extension: a step text starting with digit 8 taken as positive",
          "src/ZinHost/ValueText.cpp",
          "digitValue(digits[0]) >= 8 ? 0xF : 0;",
          "digitValue(digits[0]) > 8 ? 0xF : 0;", TOOL, TOOL_TARGETS),
    Fault("python width check: an int as wide as its signal refused",
          "python/src/Values.cpp",
          'if (value.attr("bit_length")().cast<uint64_t>() > bits) {',
          'if (value.attr("bit_length")().cast<uint64_t>() >= bits) {', PYTHON, PYTHON_TARGETS),
    Fault("python byte order: an int written most significant byte first",
          "python/src/Values.cpp",
          'return value.attr("to_bytes")(bytes, "little").cast<std::string>();',
          'return value.attr("to_bytes")(bytes, "big").cast<std::string>();', PYTHON,
          PYTHON_TARGETS),
]


def run(cmd, cwd, log=None, env=None, timeout=None):
    """Runs a command; its output goes to `log` (a file) or is captured. Returns the exit code."""
    out = open(log, "a") if log else subprocess.DEVNULL
    try:
        return subprocess.run(cmd, cwd=cwd, stdout=out, stderr=subprocess.STDOUT, env=env,
                              timeout=timeout).returncode
    except subprocess.TimeoutExpired:
        return -1
    finally:
        if log:
            out.close()


def sync_tree(work):
    """Copies the tracked files (as they are in the working tree) into `work`, rewriting only
    files whose content differs so that the incremental build stays incremental."""
    listed = subprocess.run(["git", "ls-files", "-z"], cwd=ROOT, check=True,
                            capture_output=True).stdout.decode().split("\0")
    files = [f for f in listed if f and (ROOT / f).is_file()]
    for f in files:
        source, target = ROOT / f, work / f
        data = source.read_bytes()
        if target.is_file() and target.read_bytes() == data:
            continue
        target.parent.mkdir(parents=True, exist_ok=True)
        target.write_bytes(data)
        shutil.copymode(source, target)
    keep = set(files)
    for folder, subfolders, names in os.walk(work):
        if Path(folder) == work and "build" in subfolders:
            subfolders.remove("build")
        for name in names:
            relative = (Path(folder) / name).relative_to(work).as_posix()
            if relative not in keep and relative != "mutate.log":
                (Path(folder) / name).unlink()


def check_snippets(faults, work):
    problems = []
    for fault in faults:
        path = work / fault.path
        text = path.read_text() if path.is_file() else None
        count = text.count(fault.original) if text is not None else 0
        if text is None:
            problems.append(f"{fault.name}: {fault.path} does not exist")
        elif count != 1:
            problems.append(f"{fault.name}: snippet found {count} times in {fault.path}")
    return problems


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--work", default="/tmp/zinmox-mutate",
                        help="scratch folder, kept between runs (default: %(default)s)")
    parser.add_argument("--only", help="comma-separated words; run the faults whose name has one")
    parser.add_argument("--list", action="store_true", help="list the faults and stop")
    parser.add_argument("--jobs", type=int, default=2, help="build jobs (default: %(default)s)")
    args = parser.parse_args()

    faults = FAULTS
    if args.only:
        words = [w.strip() for w in args.only.split(",") if w.strip()]
        faults = [f for f in faults if any(w in f.name for w in words)]
    if args.list:
        for fault in faults:
            print(f"{fault.path}: {fault.name}")
        return 0
    if not faults:
        print("no fault matches", file=sys.stderr)
        return 2

    work = Path(args.work).resolve()
    work.mkdir(parents=True, exist_ok=True)
    log = work / "mutate.log"
    log.write_text("")
    env = dict(os.environ, CMAKE_CXX_COMPILER_LAUNCHER="ccache",
               CMAKE_C_COMPILER_LAUNCHER="ccache", CCACHE_BASEDIR=str(work))
    sync_tree(work)
    problems = check_snippets(faults, work)
    if problems:
        print("The fault list does not match the code:", file=sys.stderr)
        for problem in problems:
            print("  " + problem, file=sys.stderr)
        return 2

    build = ["nice", "-n", "5", "cmake", "--build", "build/default", "-j", str(args.jobs),
             "--target"]
    ctest = ["ctest", "--test-dir", "build/default", "--no-tests=error", "--timeout", "120",
             "-j", str(args.jobs), "-R"]
    started = time.monotonic()
    if not (work / "build/default/CMakeCache.txt").is_file():
        if run(["cmake", "--preset", "default"], work, log, env) != 0:
            print(f"configuring failed; see {log}", file=sys.stderr)
            return 2
    # Without any fault, everything the faults use must build and pass.
    groups = {}
    for fault in faults:
        groups.setdefault(fault.tests, set()).update(fault.targets)
    for tests, targets in groups.items():
        if run(build + sorted(targets), work, log, env) != 0 or \
                run(ctest + [tests], work, log, env) != 0:
            print(f"the unchanged tree fails {tests}; see {log}", file=sys.stderr)
            return 2

    survivors, broken = [], []
    for number, fault in enumerate(faults, 1):
        path = work / fault.path
        original = path.read_text()
        path.write_text(original.replace(fault.original, fault.replacement, 1))
        try:
            if run(build + fault.targets, work, log, env) != 0:
                verdict = "DOES NOT BUILD"
                broken.append(fault)
            elif run(ctest + [fault.tests], work, log, env, timeout=600) != 0:
                verdict = "killed"
            else:
                verdict = "SURVIVED"
                survivors.append(fault)
        finally:
            path.write_text(original)
        print(f"[{number:2}/{len(faults)}] {verdict:14} {fault.name} ({fault.path})", flush=True)
    # Leave the scratch build matching the tree.
    for targets in groups.values():
        run(build + sorted(targets), work, log, env)

    minutes = (time.monotonic() - started) / 60
    print(f"{len(faults) - len(survivors) - len(broken)} of {len(faults)} faults killed, "
          f"{len(survivors)} survived, {len(broken)} did not build ({minutes:.1f} min)")
    return 1 if survivors or broken else 0


if __name__ == "__main__":
    sys.exit(main())
