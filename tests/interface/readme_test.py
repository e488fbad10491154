"""The README shows examples/hello.cpp as it is, and what it and the other programs print.

usage: readme_test.py ROOT HELLO EVENTS SETTINGS [EMULATOR ...]
"""
import os, subprocess, sys

root, hello, events, settings, emulator = *sys.argv[1:5], sys.argv[5:]
readme = open(os.path.join(root, "README.md"), encoding="utf-8").read()
source = open(os.path.join(root, "examples", "hello.cpp"), encoding="utf-8").read()
assert f"```cpp\n{source}```" in readme, "README.md does not show examples/hello.cpp as it stands"
for program in hello, events, settings:
    output = subprocess.run(emulator + [program], capture_output=True, text=True, check=True).stdout
    assert f"```\n{output}```" in readme, f"README.md does not show what {program} prints:\n{output}"
    print(output)
