"""The README shows examples/hello.cpp as it is, and what it and examples/events.cpp print.

usage: readme_test.py ROOT HELLO EVENTS [EMULATOR ...]
"""
import os, subprocess, sys

root, hello, events, emulator = sys.argv[1], sys.argv[2], sys.argv[3], sys.argv[4:]
readme = open(os.path.join(root, "README.md"), encoding="utf-8").read()
source = open(os.path.join(root, "examples", "hello.cpp"), encoding="utf-8").read()
assert f"```cpp\n{source}```" in readme, "README.md does not show examples/hello.cpp as it stands"
for program in hello, events:
    output = subprocess.run(emulator + [program], capture_output=True, text=True, check=True).stdout
    assert f"```\n{output}```" in readme, f"README.md does not show what {program} prints:\n{output}"
    print(output)
