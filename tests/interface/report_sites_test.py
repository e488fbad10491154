"""Every report site has a code of its own, so that a code in a log names one place."""
import os, re, sys

root = sys.argv[1]
SITE = re.compile(r"TESSEL_REPORT\s*\(\s*[^,()]+(?:\([^()]*\))?[^,]*,\s*(0x[0-9A-Fa-f]+)u?\s*\)")
seen, calls, twice = {}, 0, []
for folder, _, names in os.walk(os.path.join(root, "source")):
    for name in names:
        if not name.endswith((".cpp", ".h")):
            continue
        path = os.path.join(folder, name)
        text = open(path, encoding="utf-8").read()
        for match in SITE.finditer(text):
            calls += 1
            place = f"{os.path.relpath(path, root)}:{text.count(chr(10), 0, match.start()) + 1}"
            code = int(match.group(1), 16)
            if code in seen:
                twice.append(f"0x{code:08X}: {seen[code]} and {place}")
            seen.setdefault(code, place)
print("\n".join(twice))
print(f"{calls} report sites, {len(twice)} codes used twice")
sys.exit(1 if twice or not calls else 0)
