#!/usr/bin/env python3
"""Runs the command `tessel` over resource files and looks at the results with a reader of its own.

usage: fixtures_test.py DATA-FOLDER COMMAND...

The reader below is written from the layout of the format alone and shares nothing with the library.
"""
import json
import pathlib
import random
import shutil
import struct
import subprocess
import sys
import tempfile
import unittest

DATA = COMMAND = None
CHANGED, PROTECTED = 0x02, 0x08


def tessel(*words, stdin=b""):
    return subprocess.run([*COMMAND, "rsrc", *map(str, words)], input=stdin, capture_output=True, timeout=120)


def latin(raw):
    return raw.decode("latin-1")


def parse(data):
    """Header and resources of a file, in its order."""
    magic, eol, version, kind, creator, map_at, map_size, data_at, data_size = struct.unpack_from(">4s2sH4s4s4I", data)
    assert magic == b"RSRC", magic
    header = {"eol": latin(eol), "version": version, "type": latin(kind), "creator": latin(creator),
              "map_offset": map_at, "map_length": map_size, "data_offset": data_at, "data_length": data_size}
    entries = []
    if map_size <= 32:
        return header, entries
    the_map = data[map_at:map_at + map_size]
    assert the_map[:16] == data[:16], "map copy of the header"
    header["file_attrs"], types_at, names_at = struct.unpack_from(">III", the_map, 40)
    header["type_list"], header["name_list"] = types_at, names_at
    for t in range(struct.unpack_from(">i", the_map, types_at)[0] + 1):
        code, last, list_at = struct.unpack_from(">4siI", the_map, types_at + 4 + 12 * t)
        for i in range(last + 1):
            number, name_at, attrs, at, reserved = struct.unpack_from(">iiIII", the_map, types_at + list_at + 20 * i)
            name = b""
            if name_at != -1:
                start = names_at + name_at
                name = the_map[start + 1:start + 1 + the_map[start]]
            size = struct.unpack_from(">I", data, data_at + at)[0]
            raw = data[data_at + at + 4:data_at + at + 4 + size]
            assert len(raw) == size
            entries.append({"type": latin(code), "id": number, "name": latin(name), "attrs": attrs, "size": size,
                            "hex": raw.hex(), "at": at, "reserved": reserved, "name_at": name_at})
    return header, entries


def public(entry):
    return {key: entry[key] for key in ("type", "id", "name", "attrs", "size", "hex")}


class Fixtures(unittest.TestCase):
    def setUp(self):
        self.folder = pathlib.Path(tempfile.mkdtemp())
        self.addCleanup(shutil.rmtree, self.folder)

    def check_packed(self, data):
        """What holds for every file after an update."""
        header, entries = parse(data)
        self.assertEqual((header["version"], header["eol"], header["data_offset"]), (3, "\r\n", 32))
        self.assertEqual(header["map_offset"], 32 + header["data_length"])
        self.assertEqual(len(data), header["map_offset"] + header["map_length"])
        if not entries:
            self.assertEqual(len(data), 32)
            return entries
        self.assertEqual(header["type_list"], 52)
        end = 0
        for entry in sorted(entries, key=lambda entry: entry["at"]):
            self.assertEqual(entry["at"], end)
            padding = -entry["size"] % 4
            stop = 32 + end + 4 + entry["size"]
            self.assertEqual(data[stop:stop + padding], bytes(padding))
            end += 4 + entry["size"] + padding
        self.assertEqual(end, header["data_length"])
        for entry in entries:
            self.assertEqual((entry["attrs"] & CHANGED, entry["reserved"]), (0, 0))
        for first, second in zip(entries, entries[1:]):
            self.assertTrue(first["type"] != second["type"] or first["id"] < second["id"])
        # Type list, reference lists and names fill the map, each in its place as it was read.
        types = {entry["type"] for entry in entries}
        names = sum(len(entry["name"]) + 1 for entry in entries if entry["name_at"] != -1)
        self.assertEqual(header["map_length"], 56 + 12 * len(types) + 20 * len(entries) + names)
        return entries

    def run_ok(self, *words, stdin=b""):
        result = tessel(*words, stdin=stdin)
        self.assertEqual((result.returncode, result.stderr), (0, b""), words)
        return result.stdout

    def refused(self, code, *words, stdin=b""):
        result = tessel(*words, stdin=stdin)
        self.assertEqual(result.returncode, 1, words)
        self.assertRegex(result.stderr.decode(), rf"^tessel: .*: .+ \({code}\)\n$")

    def test_list_is_what_the_files_hold(self):
        for name, expected in json.loads((DATA / "rsrc.json").read_text()).items():
            with self.subTest(name):
                if "error" in expected:
                    self.refused(expected["error"], "list", DATA / name, "--json")
                    self.refused(expected["error"], "check", DATA / name)
                    continue
                listed = json.loads(self.run_ok("list", DATA / name, "--json"))
                self.assertEqual(listed["resources"], expected["resources"])
                self.assertEqual(listed["header"], {**listed["header"], **expected.get("header", {})})
                lines = self.run_ok("list", DATA / name).decode().splitlines()
                self.assertEqual(len(lines), 1 + len(expected["resources"]))
                self.run_ok("check", DATA / name)

    def test_check_counts_the_strings_of_a_list(self):
        with tempfile.TemporaryDirectory() as folder:
            file = pathlib.Path(folder) / "f.rsrc"
            for identifier, count in enumerate((b"\xff\x01", b"\x00\x02", b"\x00"), 1):
                self.run_ok("create", file, "--replace")
                self.run_ok("add", file, "STR#", identifier, stdin=count + (b"\x01x" if len(count) == 2 else b""))
                self.refused(4, "check", file)

    def test_reading_one(self):
        plain = DATA / "plain.rsrc"
        for entry in parse(plain.read_bytes())[1]:
            self.assertEqual(self.run_ok("get", plain, entry["type"], entry["id"]).hex(), entry["hex"])
        self.assertEqual(self.run_ok("get", plain, "0x53545220", -1), b"\x0bnegative id")
        self.assertEqual(self.run_ok("strings", plain, 5), b"one\ntwo\nthree\n")
        self.refused(15, "get", plain, "STR#", 6)
        self.refused(15, "strings", plain, 6)
        self.refused(7, "list", self.folder / "missing")

    def test_random_edits_match_a_model(self):
        chance = random.Random(20)
        for name in ("plain", "empty", "map-first", "holes", "unsorted", "version2"):
            file = self.folder / f"{name}.rsrc"
            file.write_bytes((DATA / file.name).read_bytes())
            model = {}
            for entry in parse(file.read_bytes())[1]:
                model.setdefault(entry["type"], {})[entry["id"]] = (entry["name"], entry["attrs"], entry["hex"])
            self.run_ok("add", file, "New", 9, "--name", "n", "--attrs", "0x41", stdin=b"12345")
            model["New "] = {9: ("n", 0x41, b"12345".hex())}
            for _ in range(20):
                self.edit(chance, file, model)
                self.assertEqual(
                    [public(entry) for entry in self.check_packed(file.read_bytes())],
                    [{"type": kind, "id": number, "name": of[0], "attrs": of[1], "size": len(of[2]) // 2, "hex": of[2]}
                     for kind, numbers in model.items() for number, of in sorted(numbers.items())])

    def edit(self, chance, file, model):
        held = [(kind, number) for kind in model for number in model[kind]]
        verb = chance.choice(["add", "add", "replace", "remove", "remove"]) if held else "add"
        raw = chance.randbytes(chance.choice([0, 1, 3, 4, 5, 255, 4088, 4089, 4093, 9000]))
        if verb == "add":
            kind, number = chance.choice(["STR#", "DATA", "abcd"]), chance.randrange(-20, 20)
            name = chance.choice(["", "x", "a longer name", "n" * 255])
            if number in model.get(kind, {}):
                before = file.read_bytes()
                self.refused(14, "add", file, kind, number, stdin=raw)
                self.assertEqual(file.read_bytes(), before)
                return
            self.run_ok("add", file, kind, number, "--name", name, stdin=raw)
            model.setdefault(kind, {})[number] = (name, 0, raw.hex())
            return
        kind, number = chance.choice(held)
        name, attrs, _ = model[kind][number]
        if verb == "replace":
            self.run_ok("replace", file, kind, number, stdin=raw)
            model[kind][number] = (name, attrs, raw.hex())
        elif attrs & PROTECTED:
            self.refused(15, "remove", file, kind, number)
        else:
            self.run_ok("remove", file, kind, number)
            del model[kind][number]
            if not model[kind]:
                del model[kind]

    def test_create_and_append(self):
        file = self.folder / "new.rsrc"
        self.run_ok("create", file, "--type", "abc", "--creator", "0x00ff4142")
        header = parse(file.read_bytes())[0]
        self.assertEqual((header["type"], header["creator"]), ("abc ", "\x00\xffAB"))
        self.refused(10, "create", file)
        self.run_ok("create", file, "--replace")
        self.run_ok("add", file, "STR ", 1, stdin=b"\x02hi")
        host = self.folder / "host.bin"
        host.write_bytes(b"not a resource file, but long enough to look for a header in")
        out = self.folder / "out.bin"
        self.run_ok("append", host, file, "-o", out)
        self.assertEqual(out.read_bytes(),
                         host.read_bytes() + file.read_bytes() + struct.pack(">I", host.stat().st_size))
        self.assertEqual(self.run_ok("get", out, "STR ", 1), b"\x02hi")
        self.refused(13, "add", out, "STR ", 2)
        self.refused(13, "append", host, host, "-o", out)

    def test_usage(self):
        for words in ([], ["frobnicate"], ["list"], ["list", "a", "b"], ["get", "f", "toolong", "1"],
                      ["get", "f", "STR ", "x"], ["get", "f", "STR ", "9999999999"], ["append", "a", "b"],
                      ["add", "f", "STR ", "1", "--colour"]):
            self.assertEqual(tessel(*words).returncode, 2, words)
        verbs = ("list", "get", "strings", "create", "add", "replace", "remove", "append", "check")
        self.assertTrue(all(verb in self.run_ok("--help").decode() for verb in verbs))
        for verb in verbs:
            self.assertIn(f"usage: tessel rsrc {verb} ", self.run_ok(verb, "--help").decode())


if __name__ == "__main__":
    DATA, COMMAND = pathlib.Path(sys.argv[1]), sys.argv[2:]
    unittest.main(argv=sys.argv[:1])
