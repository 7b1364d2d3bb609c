#!/usr/bin/env python3
"""Usage: write_mrc_files.py FOLDER

Writes MRC files of every mode, kind and byte order that the mrcfile package supports into FOLDER, and their
expected properties and pictures into FOLDER/expected.txt. The files are written by that package, and the pictures
are computed here with numpy, so nothing is shared with the code under test.
"""

import math
import pathlib
import sys

import mrcfile
import numpy

# Bits per pixel and type name of each mode. Half floats (12) are read as 8-bit pixels.
TYPES = {
    0: (8, "8 bit unsigned"),
    1: (16, "16 bit signed"),
    2: (32, "32 bit float"),
    4: (64, "64 bit complex float"),
    6: (16, "16 bit unsigned"),
    12: (8, "8 bit unsigned"),
}


def shown_values(data, section, mode):
    """Returns the pixels of a section in the type that its mode is shown as, with the first row last."""
    if mode in (0, 12):  # one-byte pixels, even if the file has two bytes per pixel
        shape = data.shape
        count = shape[1] * shape[2]
        pixels = numpy.frombuffer(data.tobytes(), numpy.uint8, count, section * count)
        return pixels.reshape(shape[1:])[::-1]
    frame = data[section]
    flipped = frame[::-1]
    if mode in (2, 4) and frame.dtype.byteorder == ">":  # values of more than 16 bits are not swapped
        little = frame.dtype.newbyteorder("<")
        flipped = numpy.frombuffer(flipped.tobytes(), little).reshape(frame.shape)
    if mode == 4:
        parts = flipped.astype(numpy.complex128)
        squares = parts.real * parts.real + parts.imag * parts.imag
        return numpy.array([[math.log(x) if x else -math.inf for x in row] for row in squares], numpy.float32)
    return flipped.astype(flipped.dtype.newbyteorder("="))


def picture(values, request):
    """Returns the grey levels of a thumbnail."""
    height, width = values.shape
    f = max(width // request[0], height // request[1], 1)
    rows, columns = height // f * f, width // f * f
    sums = numpy.zeros((height // f, width // f))
    for y in range(f):
        for x in range(f):
            sums = sums + values[y:rows:f, x:columns:f].astype(numpy.float64)
    averages = sums * (1.0 / (f * f))
    reduced = averages.astype(values.dtype) if values.dtype == numpy.float32 else numpy.trunc(averages)
    difference = (reduced - reduced.min()).astype(numpy.float64)
    span = difference.max()
    return numpy.trunc(difference * (255.0 / (span if span else 1.0))).astype(numpy.uint8)


def frames(random, count, shape, dtype):
    """Returns random frames with a bright disc, each at another level."""
    dtype = numpy.dtype(dtype)
    y, x = numpy.mgrid[: shape[0], : shape[1]]
    disc = (x - shape[1] / 2) ** 2 + (y - shape[0] / 3) ** 2 < (min(shape) / 4) ** 2
    stack = []
    for number in range(count):
        frame = random.integers(0, 90, shape) + 30 * disc + number
        if dtype.kind == "c":
            frame = frame + 1j * random.integers(-50, 50, shape)
        elif dtype.kind == "f":
            frame = frame / 7.0
        elif dtype.kind == "i":
            frame = frame - 60
        elif dtype.kind == "u":
            frame = frame * 400
        stack.append(frame.astype(dtype))
    return numpy.array(stack, dtype)


def main(folder):
    folder = pathlib.Path(folder)
    folder.mkdir(parents=True, exist_ok=True)
    random = numpy.random.default_rng(20260)
    expected = []
    for order in "<>":
        for code in ("i1", "i2", "f4", "c8", "u2", "f2"):
            for kind, sections in (("image", 1), ("stack", 2), ("volume", 5), ("volumes", 6)):
                shape = tuple(int(edge) for edge in random.integers(20, 90, 2))
                data = frames(random, sections, shape, order + code)
                name = f"{'little' if order == '<' else 'big'}-{code}-{kind}.mrc"
                with mrcfile.new(folder / name, overwrite=True) as mrc:
                    if kind == "image":
                        mrc.set_data(data[0])
                    elif kind == "volumes":
                        mrc.set_data(data.reshape(2, 3, *shape))
                    else:
                        mrc.set_data(data)
                        mrc.set_image_stack() if kind == "stack" else mrc.set_volume()
                    mrc.header.label[0] = "Created by mrcfile.py"  # without the time, so that the output is reproducible
                    mrc.add_label(f"  {kind} of {code}")
                    if kind in ("stack", "volumes"):
                        mrc.set_extended_header(numpy.arange(777, dtype="u1"))
                    mode = int(mrc.header.mode)
                    labels = mrc.get_labels()
                    stored = mrc.data.dtype
                assert stored == numpy.dtype(order + code), (stored, order + code)
                bits, type_name = TYPES[mode]
                values = shown_values(data, sections // 2, mode)
                expected += [f"file {name}", f"size {shape[1]} {shape[0]}", f"sections {sections}"]
                expected += [f"bits {bits}", f"type {type_name}"]
                expected += [f"label {label.rstrip(' ')}" for label in labels]
                for request in ((128, 128), (16, 16), (7, 30)):
                    levels = picture(values, request)
                    size = f"{levels.shape[1]} {levels.shape[0]}"
                    expected.append(f"picture {request[0]} {request[1]} {size} {levels.tobytes().hex()}")
    (folder / "expected.txt").write_text("\n".join(expected) + "\n")


if __name__ == "__main__":
    if len(sys.argv) != 2:
        sys.exit(__doc__.splitlines()[0])
    main(sys.argv[1])
