#!/usr/bin/python3
"""Compares the pictures that qelthumb makes with those of the DLL, byte by byte.

usage: identity_test.py BUILD EMULATOR DLL_PICTURES

DLL_PICTURES is the Windows program that writes the DLL's bitmaps (dll_pictures.cpp).
"""

import pathlib
import subprocess
import sys
import tempfile

import numpy
from PIL import Image

from stage import Stage, run

SIZES = (64, 128, 256, 512, 1024)


def size_of(file, stage, out):
    """Returns the longest side of the picture, made without reduction."""
    run(stage.program, 4096, file, out)
    with Image.open(out) as picture:
        return max(picture.size)


def native_bytes(path):
    """Returns the width, the height and the bits per pixel, then the pixels as in a bitmap: blue first."""
    with Image.open(path) as picture:
        pixels = numpy.asarray(picture)
    bits = 8 if pixels.ndim == 2 else 24
    if bits == 24:
        pixels = pixels[:, :, ::-1]
    return f"{pixels.shape[1]} {pixels.shape[0]} {bits}\n".encode() + pixels.tobytes()


def main(build, emulator, dll_pictures):
    stage = Stage(build)
    with tempfile.TemporaryDirectory() as folder:
        folder = pathlib.Path(folder)
        requests = []
        for file in stage.pictures():
            longest = size_of(file, stage, folder / "whole.png")
            for size in SIZES:
                edge = longest // -(-longest // size)
                requests.append((file, size, edge, folder / f"{len(requests)}.bitmap"))
        lines = "".join(f"{edge}\t{file.name}\tZ:{out}\n" for file, size, edge, out in requests)
        # A file, because Wine's desktop process would keep a pipe open.
        with tempfile.TemporaryFile("w+") as log:
            result = subprocess.run([emulator, dll_pictures], input=lines, stdout=log, stderr=log, text=True,
                                    cwd=stage.samples)
            log.seek(0)
            if result.returncode != 0:
                sys.exit(f"dll_pictures failed: {log.read()}")
        different = []
        for file, size, edge, out in requests:
            run(stage.program, size, file, folder / "native.png")
            if native_bytes(folder / "native.png") != out.read_bytes():
                different.append(f"{file.name} at {size}, edge {edge}")
    stage.close()
    if different or len(requests) < 100:
        sys.exit(f"{len(different)} of {len(requests)} pictures differ (at least 100 must be compared): {different}")
    print(f"{len(requests)} pictures are identical.")


if __name__ == "__main__":
    main(*sys.argv[1:])
