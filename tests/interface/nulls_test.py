"""Writes a C program that calls every flat function with null for each of its pointers in turn.

usage: nulls_test.py COMPILER ROOT OUTPUT

The declarations are what the C compiler makes of <tessel/tessel.h>, the names those of docs/exports.txt. Each call runs in a process of its own; the other arguments are zeros,
empty texts, small handles and paths. A call that ends its process or does not return within ten seconds fails, unless the same call
without the null does so too: then these plain arguments are none for the function.
"""
import os, re, subprocess, sys

# Headers and functions that take back the promise for null, in these words.
WORDS = re.compile(r"not\s+(//\s+)?checked")
UNCHECKED_HEADERS = ["numerics/RealMath.h", "numerics/ComplexMath.h", "numerics/FloatingPointRegisters.h", "sync/ThAtomic.h", "time/HRTime.h"]
UNCHECKED = {"ThMutexAcquireHeld", "ThMutexWakeNext", "CompareInt16s", "CompareInt32s", "CompareUIntPtrTs"}

compiler, root, output = sys.argv[1:4]
include = os.path.join(root, "include")
with open(os.path.join(root, "docs", "exports.txt"), encoding="utf-8") as ledger:
    exported = {line.split()[0] for line in ledger if line.strip() and not line.startswith("#")}
text = subprocess.run([compiler, "-std=c11", "-E", "-P", "-I", include, "-include", "tessel/tessel.h", "-x", "c", os.devnull],
                      capture_output=True, text=True, check=True).stdout
for header in UNCHECKED_HEADERS:
    with open(os.path.join(include, "tessel", header), encoding="utf-8") as file:
        words = file.read()
    if not WORDS.search(words):
        sys.exit(f"{header} does not say that null is not checked")
    UNCHECKED |= set(re.findall(r"[A-Za-z_]\w*", words))
    UNCHECKED |= {"".join(pair) for pair in re.findall(r"([A-Za-z_]\w*)\s*##\s*([A-Za-z_]\w*)", words)}
text = re.sub(r"\s+", " ", text)


def split(parameters):
    parts, depth, start = [], 0, 0
    for i, c in enumerate(parameters + ","):
        depth += (c == "(") - (c == ")")
        if c == "," and depth == 0:
            parts.append(parameters[start:i].strip())
            start = i + 1
    return parts


def argument_type(parameter):
    parameter = re.sub(r"\[[^\]]*\]$", lambda _: "[]", parameter)
    if "(*" in parameter:
        return re.sub(r"\(\*\s*\w*\)", "(*)", parameter, count=1)
    array = parameter.endswith("[]")
    parameter = parameter.removesuffix("[]").strip()
    words = re.match(r"^(.*?[\s*])(\w+)$", parameter)
    base = words.group(1).strip() if words and words.group(1).strip() not in ("const", "struct", "unsigned") else parameter
    return base + ("*" if array else "")


functions = {}
for match in re.finditer(r'__attribute__\(\(visibility\("default"\)\)\)\s*([^;{}()]*?)\b(\w+)\s*\(((?:[^()]|\([^()]*\))*)\)\s*(?:__attribute__[^;]*)?;', text):
    result, name, parameters = match.groups()
    if name in exported:
        functions[name] = [] if parameters.strip() in ("void", "") else [argument_type(p) for p in split(parameters) if p != "..."]


def kind(type_name):
    if re.search(r"(Proc|Callback|Compare|Handler|Func|Fn)\w*$", type_name) or "(*)" in type_name:
        return "kProcedure"
    if re.search(r"(Handle|Hdl)$", type_name):
        return "kHandle"
    if type_name in ("Path", "ConstPath"):
        return "kPath"
    return "kOther"


with open(output, "w", encoding="utf-8") as out:
    out.write('#include "nulls_test.h"\n')
    rows = []
    for name, types in sorted(functions.items()):
        if not types or name in UNCHECKED:
            continue
        lines = [f"static bool Call_{name}(int null) {{", "    int pointers = 0;"]
        for i, t in enumerate(types):
            declare = t.replace("(*)", f"(*a{i})", 1) if "(*)" in t else f"{t} a{i}"
            constless = re.sub(r"^const (\w+)$", r"\1", t)
            declare = declare if "(*)" in t else f"{constless} a{i}"
            lines.append(f"    {declare}; MakeArgument((void*)&a{i}, sizeof a{i}, IS_POINTER(a{i}), {kind(t)}, null, &pointers);")
        lines.append("    if (null >= pointers) return false;")
        lines.append(f"    (void)(IGNORE({name}({', '.join(f'a{i}' for i in range(len(types)))})));")
        lines += ["    return true;", "}"]
        out.write("\n".join(lines) + "\n")
        rows.append(f'    {{"{name}", Call_{name}}},\n')
    out.write("static const Function kFunctions[] = {\n" + "".join(rows) + "};\n")
    out.write("int main(int count, char** arguments) { return RunAll(kFunctions, sizeof kFunctions / sizeof *kFunctions, count, arguments); }\n")
missing = exported - set(functions)
if missing:
    sys.exit(f"not understood: {' '.join(sorted(missing))}")
