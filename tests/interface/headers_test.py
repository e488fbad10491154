"""Compiles every public header alone, strictly, as C++17 and as C11."""
import argparse, os, subprocess, sys
from concurrent.futures import ThreadPoolExecutor

parser = argparse.ArgumentParser()
parser.add_argument("--cc", required=True)
parser.add_argument("--cxx", required=True)
parser.add_argument("--flags", default="")
parser.add_argument("include")
args = parser.parse_args()

STRICT = ["-Wall", "-Wextra", "-Wpedantic", "-Wshadow", "-Werror", "-fsyntax-only", "-I", args.include] + args.flags.split()
headers = [os.path.relpath(os.path.join(folder, name), args.include)
           for folder, _, names in os.walk(os.path.join(args.include, "tessel")) for name in names if name.endswith(".h")]


def problem(job):
    header, command = job
    source = f"#include <{header}>\n#include <{header}>\ntypedef int not_an_empty_translation_unit;\n"
    run = subprocess.run(command + STRICT + ["-"], input=source, capture_output=True, text=True)
    return f"{header}: {' '.join(command)}\n{run.stderr}" if run.returncode else None


jobs = [(header, command) for header in sorted(headers)
        for command in ([args.cxx, "-std=c++17", "-x", "c++"], [args.cc, "-std=c11", "-x", "c"])]
with ThreadPoolExecutor(os.cpu_count()) as pool:
    problems = [p for p in pool.map(problem, jobs) if p]
print("\n".join(problems))
print(f"{len(headers)} headers, {len(problems)} that do not compile alone")
sys.exit(1 if problems or not headers else 0)
