"""Holds the built library against docs/exports.txt: a line a flat symbol, with the version that added it.

usage: exports_test.py LIBRARY ROOT [--write VERSION]

Every flat symbol that the library exports stands in the ledger and in a public header, and the other way round.
Of the mangled symbols, only those of namespace tessel are exported. --write adds what is new under VERSION.
"""
import os, re, subprocess, sys

library, root = sys.argv[1:3]
ledger_path = os.path.join(root, "docs", "exports.txt")
exported = [line.split() for line in subprocess.run(["nm", "-D", "--defined-only", library], capture_output=True, text=True, check=True).stdout.splitlines()]
names = {fields[-1].split("@")[0] for fields in exported if fields[-2] != "A"}
flat = {name for name in names if not name.startswith("_Z")}
demangled = subprocess.run(["c++filt"], input="\n".join(sorted(names - flat)), capture_output=True, text=True, check=True).stdout.splitlines()
foreign = [name for name in demangled if "tessel::" not in name]

words = set()
for folder, _, files in os.walk(os.path.join(root, "include")):
    for file in files:
        text = open(os.path.join(folder, file), encoding="utf-8").read()
        words |= set(re.findall(r"[A-Za-z_]\w*", text))
        words |= {"".join(pair) for pair in re.findall(r"([A-Za-z_]\w*)\s*##\s*([A-Za-z_]\w*)", text)}

ledger = {}
if os.path.exists(ledger_path):
    ledger = dict(line.split() for line in open(ledger_path, encoding="utf-8") if line.strip() and not line.startswith("#"))
if "--write" in sys.argv:
    version = sys.argv[sys.argv.index("--write") + 1]
    ledger = {name: ledger.get(name, version) for name in flat}
    with open(ledger_path, "w", encoding="utf-8") as out:
        out.write("# The flat symbols of libtessel.so and the version that added each. `./dev exports` adds new ones.\n")
        out.writelines(f"{name} {ledger[name]}\n" for name in sorted(ledger))

problems = [f"exported, not in docs/exports.txt: {name}" for name in sorted(flat - set(ledger))]
problems += [f"in docs/exports.txt, not exported: {name}" for name in sorted(set(ledger) - flat)]
problems += [f"exported, in no public header: {name}" for name in sorted(flat - words)]
problems += [f"exported, not ours: {name}" for name in foreign]
print("\n".join(problems))
print(f"{len(flat)} flat symbols, {len(demangled)} of classes, {len(problems)} problems")
sys.exit(1 if problems or not flat else 0)
