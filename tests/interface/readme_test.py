"""The README shows examples/hello.cpp as it is, and what it prints.  usage: readme_test.py ROOT PROGRAM ..."""
import os, subprocess, sys

root, program = sys.argv[1], sys.argv[2:]
readme = open(os.path.join(root, "README.md"), encoding="utf-8").read()
source = open(os.path.join(root, "examples", "hello.cpp"), encoding="utf-8").read()
output = subprocess.run(program, capture_output=True, text=True, check=True).stdout
assert f"```cpp\n{source}```" in readme, "README.md does not show examples/hello.cpp as it stands"
assert f"```\n{output}```" in readme, f"README.md does not show what the program prints:\n{output}"
print(output)
