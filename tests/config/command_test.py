#!/usr/bin/env python3
"""Runs `tessel prefs` over a preference file and looks at the bytes itself.

usage: command_test.py COMMAND...
"""
import json
import pathlib
import subprocess
import sys
import tempfile
import unittest

COMMAND = None


class Prefs(unittest.TestCase):
    def setUp(self):
        folder = tempfile.TemporaryDirectory()
        self.addCleanup(folder.cleanup)
        self.file = pathlib.Path(folder.name, "app.ini")

    def tessel(self, *words, expect=(0, "")):
        run = subprocess.run([*COMMAND, "prefs", str(self.file), *words], capture_output=True, timeout=120)
        self.assertEqual(expect, (run.returncode, run.stderr.decode()), words)
        return run.stdout.decode()

    def test_values_come_and_go(self):
        self.tessel("set", "-s", "View", "zoom", "1.5", "--type", "F32")
        self.tessel("set", "first", " raw value ")
        self.tessel("set", "-s", "View", "path", "C:\\a", "--type", "Path")
        self.tessel("set", "-s", "View", "title", " a;b ", "--type", "LStr")
        expected = b'first=raw value\r\n[View]\r\nzoom=1.500000\r\npath=C:\\a\r\ntitle=" a;b "\r\n'
        self.assertEqual(expected, self.file.read_bytes().replace(b"\r\n\r\n", b"\r\n"))
        before = self.file.read_bytes()
        self.assertEqual("raw value\n", self.tessel("get", "first"))
        self.assertEqual(" a;b \n", self.tessel("get", "-s", "view", "TITLE"))
        self.assertEqual("1\n", self.tessel("get", "-s", "View", "zoom", "--type", "I32"))
        self.assertEqual("first=raw value\n[View]\nzoom=1.500000\npath=C:\\a\ntitle= a;b \n", self.tessel("list"))
        sections = json.loads(self.tessel("list", "--json"))["sections"]
        self.assertEqual(["(null)", "View"], [section["name"] for section in sections])
        self.assertEqual({"key": "path", "value": "C:\\a"}, sections[1]["keys"][1])
        self.assertEqual(f"{self.file}: 2 sections, 4 keys\n", self.tessel("check"))
        self.assertEqual(before, self.file.read_bytes(), "to look is not to write")
        self.tessel("remove", "-s", "View", "zoom")
        self.assertEqual(before.replace(b"zoom=1.500000\r\n", b""), self.file.read_bytes())

    def test_refusals_say_why(self):
        missing = (1, f"tessel: {self.file}: open: there is no such file or folder (7)\n")
        for verb in ["list"], ["check"], ["get", "k"], ["remove", "k"]:
            self.tessel(*verb, expect=missing)
        self.file.write_bytes(b"k=maybe\n")
        no_key = (1, f"tessel: {self.file}: x: get: configuration key not found (20)\n")
        self.tessel("get", "x", expect=no_key)
        self.tessel("remove", "x", expect=no_key)
        self.tessel("get", "k", "--type", "Bool",
                    expect=(1, 'tessel: "maybe": convert: text cannot be converted to the configuration type (21)\n'))
        self.tessel("set", "k", "1", "--type", "Nine", expect=(1, 'tessel: "1": convert: unknown configuration type (19)\n'))
        self.assertEqual(b"k=maybe\n", self.file.read_bytes(), "what has no section stays without one")
        self.file.write_bytes(b"\xff\xfek")
        for words in ["list"], ["check"], ["set", "k", "1"]:
            self.tessel(*words, expect=(1, f"tessel: {self.file}: {'set' if len(words) > 1 else 'read'}: unsupported format or operation (53)\n"))
        self.assertEqual(b"\xff\xfek", self.file.read_bytes())
        for words in [], ["grow"], ["get"], ["set", "k"]:
            run = subprocess.run([*COMMAND, "prefs", str(self.file), *words], capture_output=True, timeout=120)
            self.assertEqual(2, run.returncode)


if __name__ == "__main__":
    COMMAND = sys.argv[1:]
    unittest.main(argv=sys.argv[:1])
