"""The Python package against kyvhost and against the public headers.

    python_test.py SOURCES KYVHOST MODULE    with the package's folder in PYTHONPATH
"""

import ctypes
import itertools
import json
import os
import re
import shutil
import struct
import subprocess
import sys
import tempfile
import threading
import tracemalloc
import unittest
import zlib
from pathlib import Path

import numpy as np

SOURCES, KYVHOST, MODULE = sys.argv[1:4]
os.environ["KYV_DSP_MODULE"] = MODULE
os.environ["LC_ALL"] = "en_US.UTF-8"

import kyvdsp  # noqa: E402
from kyvdsp import _records as records  # noqa: E402

# Values away from the defaults, so that each effect has something to do at 1.5 s.
SETTINGS = {
    "bubble": {"P1": 0.4, "P2": 0.9, "P3": 1.0},
    "refractive-bubble": {"P2": 0.9, "P3": 1.0},
    "water-ripple": {"P1": 0.8},
    "fireworks": {"P1": 0.9, "P2": 1.0},
    "freeform-picture-in-picture": {"P0": 0.1, "P3": 0.15, "P16": "#204060", "P18": "LR", "P24": 8},
    "alpha-transition": {"P1": 0.45, "P4": True},
    "test-alpha-transition": {"P1": 0.6, "P2": 7},
    "dreamy": {"P1": 20, "P2": (0.1, 0.2, 0.9, 0.8), "P3": "circle", "P4": 0.2},
    "light-ray": {"P1": 25, "P2": (0.4, 0.25)},
    "pencil-sketch": {"P1": 3, "P8": True},
    "color-temperature": {"P1": -0.6, "P2": 2, "P3": 0.25},
    "white-balance": {"P1": "#E0B080"},
}
WIDTH, HEIGHT = 64, 48


def host(*arguments):
    return subprocess.run(
        [KYVHOST, *arguments, "--module", MODULE], check=True, capture_output=True, text=True
    ).stdout


def scene(seed, width=WIDTH):
    """A smooth picture with some noise; opaque, since picture files may lose what is transparent."""
    y, x = np.mgrid[0:HEIGHT, 0:width]
    frame = np.stack([x * 3 + seed, y * 5, (x + y) * 2, x * 0 + 255], axis=2)
    frame[:, :, :3] += np.random.default_rng(seed).integers(0, 40, (HEIGHT, width, 3))
    return np.clip(frame, 0, 255).astype(np.uint8)


def write_png(path, frame):
    def chunk(kind, data):
        crc = struct.pack(">I", zlib.crc32(kind + data))
        return struct.pack(">I", len(data)) + kind + data + crc

    height, width = frame.shape[:2]
    rows = b"".join(b"\0" + row.tobytes() for row in frame[:, :, [2, 1, 0, 3]])
    header = struct.pack(">IIBBBBB", width, height, 8, 6, 0, 0, 0)
    path.write_bytes(
        b"\x89PNG\r\n\x1a\n"
        + chunk(b"IHDR", header)
        + chunk(b"IDAT", zlib.compress(rows))
        + chunk(b"IEND", b"")
    )


def read_png(path):
    """8 bits a sample, RGB or RGBA, not interlaced, which is what kyvhost writes."""
    data, at, packed = path.read_bytes(), 8, b""
    while at < len(data):
        (size,), kind = struct.unpack(">I", data[at : at + 4]), data[at + 4 : at + 8]
        body = data[at + 8 : at + 8 + size]
        if kind == b"IHDR":
            width, height, depth, color = struct.unpack(">IIBB", body[:10])
            assert depth == 8 and color in (2, 6), (depth, color)
            pixel = 4 if color == 6 else 3
        packed += body if kind == b"IDAT" else b""
        at += 12 + size
    raw, stride = zlib.decompress(packed), width * pixel
    above, rows = [0] * stride, []
    for y in range(height):
        kind, *row = raw[y * (stride + 1) : (y + 1) * (stride + 1)]
        for i in range(stride):
            left, up = (row[i - pixel] if i >= pixel else 0), above[i]
            corner = above[i - pixel] if i >= pixel else 0
            nearest = min((left, up, corner), key=lambda value: abs(left + up - corner - value))
            guess = (0, left, up, (left + up) // 2, nearest)[kind]
            row[i] = row[i] + guess & 255
        rows.append(row)
        above = row
    picture = np.array(rows, np.uint8).reshape(height, width, pixel)
    if pixel == 3:
        picture = np.dstack([picture, np.full((height, width), 255, np.uint8)])
    return picture[:, :, [2, 1, 0, 3]]


def text_of(value):
    """A value as kyvhost's --set takes it."""
    if isinstance(value, bool):
        return "on" if value else "off"
    if isinstance(value, tuple):
        return ",".join(map(text_of, value))
    return f"{value:g}" if isinstance(value, float) else str(value)


class Package(unittest.TestCase):
    def setUp(self):
        folder = tempfile.TemporaryDirectory()
        self.addCleanup(folder.cleanup)
        self.folder = Path(folder.name)

    def test_records_lie_as_the_headers_say(self):
        program = ["#include <stdio.h>"]
        expected = []
        for header, kinds in (
            ("HostInterface.h", records.HOST_RECORDS),
            ("LanguageLibrary.h", records.LANGUAGE_RECORDS),
        ):
            program.append(f'#include "interface/{header}"')
            for kind in kinds:
                expected.append((kind.__name__, "", ctypes.sizeof(kind), 0))
                for name, *_ in kind._fields_:
                    place = getattr(kind, name)
                    expected.append((kind.__name__, name, place.size, place.offset))
        program.append("int main(void) {")
        for kind, name, _, _ in expected:
            size = f"sizeof((({kind}*)0)->{name})" if name else f"sizeof({kind})"
            offset = f"offsetof({kind}, {name})" if name else "(size_t)0"
            program.append(f'    printf("%zu %zu\\n", {size}, {offset});')
        program.append("    return 0;\n}")
        source, binary = self.folder / "layout.c", self.folder / "layout"
        source.write_text("\n".join(program))
        subprocess.run(["cc", "-std=c11", "-I", SOURCES, source, "-o", binary], check=True)
        lines = subprocess.run([binary], check=True, capture_output=True, text=True).stdout
        found = [tuple(map(int, line.split())) for line in lines.splitlines()]
        self.assertEqual(len(found), len(expected))
        for (kind, name, size, offset), place in zip(expected, found):
            self.assertEqual((size, offset), place, f"{kind}.{name}")

    def test_every_effect_has_the_bytes_of_kyvhost(self):
        frame, second = scene(1), scene(90)
        write_png(self.folder / "a.png", frame)
        write_png(self.folder / "b.png", second)
        self.assertLessEqual(set(SETTINGS), {info.name for info in kyvdsp.effects()})
        for info in kyvdsp.effects():
            settings = SETTINGS.get(info.name, {})
            for stereo in (False, True):
                with self.subTest(effect=info.name, stereo=stereo):
                    options = [f"--set={k}={text_of(v)}" for k, v in settings.items()]
                    options += ["--stereo=split"] if stereo else []
                    options += ["--input2", str(self.folder / "b.png")] if info.inputs > 1 else []
                    files = [str(self.folder / name) for name in ("a.png", "out.png")]
                    host("render", info.name, *files, "--time=1.5", "--overwrite", *options)
                    width = WIDTH // 2 if stereo else WIDTH
                    with kyvdsp.Effect(info, width, HEIGHT, stereo=stereo, **settings) as effect:
                        inputs = (frame, second)[: info.inputs]
                        result = effect.render(*inputs, position=1.5)
                    self.assertFalse(np.array_equal(result, frame), "nothing was done")
                    np.testing.assert_array_equal(result, read_png(self.folder / "out.png"))

    def test_names_and_texts_are_those_of_kyvhost(self):
        for info in kyvdsp.effects():
            told = json.loads(host("info", info.identifier, "--json"))
            self.assertEqual(
                (info.name, info.title, info.description, info.inputs),
                (told["shortName"], told["name"], told["description"], told["inputs"]),
            )
            for ours, theirs in zip(info.parameters, told["parameters"], strict=True):
                with self.subTest(effect=info.name, key=ours.key):
                    self.assertEqual(ours.key, theirs["key"])
                    self.assertEqual(ours.type, theirs["type"])
                    self.assertEqual(ours.minimum, theirs.get("minimum"))
                    self.assertEqual(list(ours.choices), theirs.get("choices", []))
                    self.assertEqual(text_of(ours.default), text_of(theirs["default"]))
            names = [p.name for p in info.parameters]
            self.assertEqual(len(set(names)), len(names))
        self.assertIn("bubble_density (P3)", kyvdsp.Bubble.__doc__)

    def test_views_and_shared_memory_give_the_same_bytes(self):
        large = np.zeros((HEIGHT * 2, WIDTH * 2, 4), np.uint8)
        large[::2, ::-2] = scene(5)
        frames = {
            "plain": scene(5),
            "every other row, mirrored": large[::2, ::-2],
            "columns first": np.asfortranarray(scene(5)),
        }
        frames["read-only"] = scene(5)
        frames["read-only"].flags.writeable = False
        with kyvdsp.Effect("dreamy", WIDTH, HEIGHT, degree=30) as effect:
            expected = effect.render(scene(5))
            for name, frame in frames.items():
                with self.subTest(frame=name):
                    np.testing.assert_array_equal(effect.render(frame), expected)
            out = np.zeros((HEIGHT + 2, WIDTH + 2, 4), np.uint8)
            inside = out[1:-1, 1:-1]
            self.assertIs(effect.render(scene(5), out=inside), inside)
            np.testing.assert_array_equal(inside, expected)
            self.assertFalse(out[0].any() or out[-1].any() or out[:, 0].any() or out[:, -1].any())
            frame = scene(5)
            effect.render(frame, out=frame)
            np.testing.assert_array_equal(frame, expected)
            # Half of the output is input: rows 0 to 47 of the buffer, rows 24 to 71.
            both = np.zeros((HEIGHT + 24, WIDTH, 4), np.uint8)
            both[:HEIGHT] = scene(5)
            effect.render(both[:HEIGHT], out=both[24:])
            np.testing.assert_array_equal(both[24:], expected)

    def test_whole_arrays_are_not_copied(self):
        width, height = 1024, 1024  # 4 MiB
        frame, out = (np.zeros((height, width, 4), np.uint8) for _ in range(2))
        with kyvdsp.Effect("color-temperature", width, height, degree=0.5) as effect:
            effect.render(frame, out=out)
            tracemalloc.start()
            self.addCleanup(tracemalloc.stop)
            effect.render(frame, out=out)
            self.assertLess(tracemalloc.get_traced_memory()[1], 1 << 16)
            effect.render(frame[:, ::-1], out=out)
            self.assertGreater(tracemalloc.get_traced_memory()[1], 1 << 22)

    def test_fields_and_previews(self):
        frame = scene(3)
        with kyvdsp.Effect("color-temperature", WIDTH, HEIGHT, degree=1) as effect:
            whole = effect.render(frame)
            for field, start in (("first", 0), ("second", 1)):
                result = effect.render(frame, field=field)
                np.testing.assert_array_equal(result[start::2], whole[start::2])
                np.testing.assert_array_equal(result[1 - start :: 2], frame[1 - start :: 2])
        with kyvdsp.Effect("bubble", WIDTH, HEIGHT, P3=1.0) as effect:
            previews = [effect.render(frame, position=t, preview=0.5) for t in (0, 5)]
            np.testing.assert_array_equal(*previews)

    def test_values_come_back_as_they_went_in(self):
        with kyvdsp.Effect("freeform-picture-in-picture", WIDTH, HEIGHT) as pip:
            cases = {
                "corner_c_x": 0.6,
                "shadow-opacity": 7,
                "P8": False,
                "Border gradient": "UL",
                "shadow-color-1": "#123456",
            }
            for name, value in cases.items():
                pip[name] = value
            for name, value in cases.items():
                self.assertEqual(pip[name], value)
            pip["shadow_color_1"] = (1, 2, 255)
            self.assertEqual(pip["P16"], "#0102FF")
            pip["P8"] = "on"
            self.assertIs(pip["P8"], True)
            pip["P27"] = 2
            self.assertEqual(pip["P27"], "L")
            with self.assertRaises(ValueError):
                pip.set(corner_a_x=0.5, corner_a_y=7)
            self.assertEqual(pip["corner_a_x"], 0.25, "all of them or none")
        with kyvdsp.Effect("dreamy", WIDTH, HEIGHT, mask_softness=0.4) as dreamy:
            self.assertEqual(dreamy["P4"], 0.4)

    def test_wrong_arguments_say_what_is_wanted(self):
        frame = scene(1)
        bubble = kyvdsp.Effect("bubble", WIDTH, HEIGHT)
        wipe = kyvdsp.Effect("alpha-transition", WIDTH, HEIGHT)
        self.addCleanup(bubble.close)
        self.addCleanup(wipe.close)
        locked = frame.copy()
        locked.flags.writeable = False
        cases = [
            (lambda: bubble.render(frame[:-1]), r"\(48, 64, 4\) and type uint8"),
            (lambda: bubble.render(frame[:, :, :3]), r"\(48, 64, 4\) and type uint8"),
            (lambda: bubble.render(frame.astype(np.float32)), "float32.*uint8"),
            (lambda: bubble.render(frame.astype(np.int8)), "int8.*uint8"),
            (lambda: bubble.render([1, 2]), "list, not a NumPy array"),
            (lambda: bubble.render(None), "NoneType, not a NumPy array"),
            (lambda: bubble.render(frame, frame), "one input"),
            (lambda: bubble.render(frame, out=frame[1:]), "out has shape"),
            (lambda: bubble.render(frame, out=locked), "read-only"),
            (lambda: bubble.render(frame, position=-1), "not a time"),
            (lambda: bubble.render(frame, position=float("nan")), "not a time"),
            (lambda: bubble.render(frame, field="third"), "'first', 'second'"),
            (lambda: bubble.render(frame, preview=2), "0 to 1"),
            (lambda: wipe.render(frame), "second input"),
            (lambda: wipe.render(frame, frame[1:]), "second has shape"),
            (lambda: kyvdsp.Effect("buble", 4, 4), 'nearest is "bubble"'),
            (lambda: kyvdsp.Effect("b", 4, 4), 'no effect "b"'),
            (lambda: kyvdsp.Effect("transition", 4, 4), "more than one effect: test-alpha-transition, alpha-tr"),
            (lambda: kyvdsp.Effect("bubble", 0, 4), "width: 0 .* 1 to 32768"),
            (lambda: kyvdsp.Effect("bubble", 4, 4.5), "height: 4.5"),
            (lambda: kyvdsp.Effect("bubble", 4, 4, format="rgb"), "'argb', 'ayuv'"),
            (lambda: kyvdsp.Effect("bubble", 4, 4, densty=1), 'nearest is "bubble-density"'),
            (lambda: kyvdsp.Effect("bubble", 4, 4, size=1), "more than one.*: minimum-size, maximum-size"),
            (lambda: kyvdsp.Effect("bubble", 4, 4, P3=1.5), "P3: 1.5 is not a number, 0 to 1"),
            (lambda: kyvdsp.Effect("bubble", 4, 4, P3=float("nan")), "P3: nan"),
            (lambda: kyvdsp.Effect("bubble", 4, 4, P3="much"), "P3: 'much'"),
            (lambda: kyvdsp.Effect("dreamy", 4, 4, degree=1.5), "whole number, 1 to 40"),
            (lambda: kyvdsp.Effect("dreamy", 4, 4, mask=(1, 2)), "left, top, right, bottom"),
            (lambda: kyvdsp.Effect("dreamy", 4, 4, mask_shape="oval"), "one of box, circle"),
            (lambda: kyvdsp.Effect("white-balance", 4, 4, P1="red"), "#RRGGBB"),
            (lambda: kyvdsp.Effect("white-balance", 4, 4, compare="no"), "True or False, or 2"),
            (lambda: kyvdsp.Effect("white-balance", 4, 4, P1=(1, 2, 256)), "#RRGGBB"),
        ]
        for number, (call, wanted) in enumerate(cases):
            with self.subTest(case=number), self.assertRaisesRegex(ValueError, wanted):
                call()
        bubble.close()
        bubble.close()
        with self.assertRaisesRegex(ValueError, "closed"):
            bubble.render(frame)
        with self.assertRaises(AttributeError):
            kyvdsp.Bublle

    def test_threads_render_side_by_side(self):
        frame = scene(7)
        times = [0.5, 1.5, 2.5, 3.5]
        with kyvdsp.Effect("bubble", WIDTH, HEIGHT, P3=1.0) as effect:
            expected = [effect.render(frame, position=t) for t in times]
        shared = kyvdsp.Effect("bubble", WIDTH, HEIGHT, P3=1.0)
        self.addCleanup(shared.close)
        results = {}

        def work(index, own):
            effect = kyvdsp.Effect("bubble", WIDTH, HEIGHT, P3=1.0) if own else shared
            for repeat, (i, t) in itertools.product(range(10), enumerate(times)):
                results[index, own, repeat, i] = effect.render(frame, position=t)
            if own:
                effect.close()

        threads = [
            threading.Thread(target=work, args=(i, own)) for i in range(4) for own in (True, False)
        ]
        for thread in threads:
            thread.start()
        for thread in threads:
            thread.join()
        self.assertEqual(len(results), 4 * 2 * 10 * len(times))
        for key, result in results.items():
            np.testing.assert_array_equal(result, expected[key[-1]])

    def run_python(self, code, **environment):
        return subprocess.run(
            [sys.executable, "-c", code],
            env={**os.environ, **environment},
            capture_output=True,
            text=True,
        )

    def test_the_documents_examples_run(self):
        text = (Path(SOURCES) / "docs/python.md").read_text()
        blocks = re.findall(r"^```python\n(.*?)^```$", text, re.MULTILINE | re.DOTALL)
        self.assertEqual(len(blocks), 2)
        for block in blocks:
            run = self.run_python(block)
            self.assertEqual(run.returncode, 0, run.stderr)

    def test_texts_follow_the_user(self):
        code = "import kyvdsp; print(kyvdsp.effect_info('bubble').title)"
        german = self.run_python(code, LC_ALL="de_DE.UTF-8", PYTHONIOENCODING="utf-8")
        self.assertEqual(german.stdout, "Seifenblasen\n", german.stderr)
        # Below a folder with a dot the module finds no language library; English is there still.
        dotted = self.folder / "python3.11"
        dotted.mkdir()
        for file in Path(MODULE).parent.glob("libKyvDsp*"):
            shutil.copy(file, dotted)
        code = "import kyvdsp; print(kyvdsp.effect_info('bubble').parameter('P1').title)"
        english = self.run_python(code, KYV_DSP_MODULE=str(dotted / Path(MODULE).name))
        self.assertEqual(english.stdout, "Minimum size\n", english.stderr)

    def test_modules_that_cannot_be_used(self):
        text = self.folder / "text.so"
        text.write_text("no library")
        for module, wanted in (
            (str(self.folder / "none.so"), "KYV_DSP_MODULE"),
            (str(text), "cannot be loaded"),
        ):
            told = self.run_python("import kyvdsp; kyvdsp.effects()", KYV_DSP_MODULE=module)
            self.assertIn("ModuleError", told.stderr)
            self.assertIn(wanted, told.stderr)
        told = self.run_python(
            "import kyvdsp; from pathlib import Path\n"
            "from kyvdsp._module import Module; Module(Path('libc.so.6'))"
        )
        self.assertIn("is not a KYV DSP module", told.stderr)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])
