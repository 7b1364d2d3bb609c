"""Measures on command how long other software takes to make thumbnails, each with its fastest method.

Usage: peers.py PEER

Implements the protocol of measuring.Worker. The reply to

  thumbnail FACTOR FORMAT WIDTH HEIGHT POSITION FILE

is the nanoseconds from the file to the bytes of a picture that is reduced by FACTOR. Like this project, each peer
averages blocks, takes the logarithm of the power of complex pixels and stretches grey levels to 0..255.
"""

import ctypes
import sys
import time
from ctypes.util import find_library

import mrcfile
import numpy


def reduced(frame, factor):
    if numpy.iscomplexobj(frame):
        frame = numpy.log(frame.real**2 + frame.imag**2)
    rows, columns = (size // factor for size in frame.shape[:2])
    whole = frame[: rows * factor, : columns * factor]
    channels = frame.shape[2:]
    # Averaging one axis after the other is up to three times as fast as both at once.
    by_rows = whole.reshape(rows, factor, columns * factor, *channels).mean(axis=1)
    means = by_rows.reshape(rows, columns, factor, *channels).mean(axis=2)
    if channels:
        return means.astype("uint8")
    low, high = means.min(), means.max()
    return ((means - low) * (255 / (high - low))).astype("uint8")


class Numpy:
    @staticmethod
    def accepts(frame):
        return frame.padding == 0 and frame.spread == 1 and not frame.bottom_up

    def __call__(self, factor, pixel_format, width, height, position, file):
        dtype, channels = ("uint8", (3,)) if pixel_format == "rgb" else (pixel_format, ())
        return reduced(numpy.memmap(file, dtype, "r", position, (height, width, *channels)), factor)


class Mrcfile:
    @staticmethod
    def accepts(frame):
        return frame.kind == "mrc" and frame.pixel_format != "rgb"

    def __call__(self, factor, pixel_format, width, height, position, file):
        with mrcfile.mmap(file, "r") as mrc:
            return reduced(mrc.data, factor)


class Libvips:
    """libvips through its C interface: without Python in its loops, with its default number of threads, and reading
    from top to bottom, which is its fastest mode."""

    FORMATS = {"uint8": 0, "rgb": 0, "int8": 1, "uint16": 2, "int16": 3, "uint32": 4, "int32": 5, "float32": 6,
               "complex64": 7, "float64": 8, "complex128": 9}  # VipsBandFormat
    SEQUENTIAL = 1  # VipsAccess

    @staticmethod
    def accepts(frame):
        return Numpy.accepts(frame)

    def __init__(self):
        self._vips = ctypes.CDLL(find_library("vips"))
        self._vips.vips_error_buffer.restype = ctypes.c_char_p
        self._vips.vips_image_write_to_memory.restype = ctypes.c_void_p
        self._vips.vips_image_copy_memory.restype = ctypes.c_void_p
        self._glib = ctypes.CDLL(find_library("glib-2.0"))
        self._gobject = ctypes.CDLL(find_library("gobject-2.0"))
        self._check(self._vips.vips_init(b"bench"))
        self._vips.vips_cache_set_max(0)  # never reuse the result of the previous round

    def _check(self, status):
        if status != 0:
            raise RuntimeError(self._vips.vips_error_buffer().decode())

    def __call__(self, factor, pixel_format, width, height, position, file):
        vips = self._vips
        images = []

        def run(operation, *arguments):
            image = ctypes.c_void_p()
            self._check(operation(*arguments[:1], ctypes.byref(image), *arguments[1:], None))
            images.append(image)
            return image

        channels = 3 if pixel_format == "rgb" else 1
        image = run(vips.vips_rawload, file.encode(), width, height, channels, b"offset", ctypes.c_uint64(position),
                    b"format", self.FORMATS[pixel_format], b"access", self.SEQUENTIAL)
        if pixel_format.startswith("complex"):
            image = run(vips.vips_log, run(vips.vips_abs, image))
        image = run(vips.vips_shrink, image, ctypes.c_double(factor), ctypes.c_double(factor))
        image = ctypes.c_void_p(vips.vips_image_copy_memory(image))
        images.append(image)
        if channels == 1:
            image = run(vips.vips_scale, image)
        size = ctypes.c_size_t()
        pixels = vips.vips_image_write_to_memory(image, ctypes.byref(size))
        picture = ctypes.string_at(pixels, size.value)
        self._glib.g_free(ctypes.c_void_p(pixels))
        for image in reversed(images):
            self._gobject.g_object_unref(image)
        return numpy.frombuffer(picture, "uint8")


class ImageMagick:
    """ImageMagick through its C interface. Its pixels have 16 bits, too few for 32-bit integers."""

    CHAR_PIXEL = 1  # StorageType

    @staticmethod
    def accepts(frame):
        return Numpy.accepts(frame) and frame.pixel_format in ("uint8", "int16", "uint16", "rgb", "float32", "float64")

    def __init__(self):
        self._wand = ctypes.CDLL(find_library("MagickWand-7.Q16") or find_library("MagickWand-6.Q16"))
        self._wand.NewMagickWand.restype = ctypes.c_void_p
        self._wand.MagickWandGenesis()

    def __call__(self, factor, pixel_format, width, height, position, file):
        call = self._wand
        wand = ctypes.c_void_p(call.NewMagickWand())
        size_t = ctypes.c_size_t
        rgb = pixel_format == "rgb"
        call.MagickSetDepth(wand, size_t(8 if rgb else 8 * numpy.dtype(pixel_format).itemsize))
        call.MagickSetSizeOffset(wand, size_t(width), size_t(height), ctypes.c_ssize_t(position))
        call.MagickSetOption(wand, b"endian", b"LSB")
        if pixel_format.startswith("float"):
            call.MagickSetOption(wand, b"quantum:format", b"floating-point")
            call.MagickSetOption(wand, b"quantum:minimum", b"0")  # float values are clipped to this range
            call.MagickSetOption(wand, b"quantum:maximum", b"200")
        if not call.MagickReadImage(wand, (b"rgb:" if rgb else b"gray:") + file.encode()):
            raise RuntimeError(f"ImageMagick cannot read {file}")
        columns, rows = width // factor, height // factor
        call.MagickScaleImage(wand, size_t(columns), size_t(rows))
        if not rgb:
            call.MagickAutoLevelImage(wand)
        picture = numpy.empty((rows, columns, 3 if rgb else 1), "uint8")
        call.MagickExportImagePixels(wand, ctypes.c_ssize_t(0), ctypes.c_ssize_t(0), size_t(columns), size_t(rows),
                                     b"RGB" if rgb else b"I", self.CHAR_PIXEL,
                                     picture.ctypes.data_as(ctypes.c_void_p))
        call.DestroyMagickWand(wand)
        return picture


PEERS = {"numpy": Numpy, "mrcfile": Mrcfile, "libvips": Libvips, "ImageMagick": ImageMagick}


def main():
    thumbnail = PEERS[sys.argv[1]]()
    for line in sys.stdin:
        _, factor, pixel_format, width, height, position, file = line.rstrip("\n").split("\t")
        begin = time.perf_counter_ns()
        picture = thumbnail(int(factor), pixel_format, int(width), int(height), int(position), file)
        end = time.perf_counter_ns()
        levels = 1 if pixel_format == "rgb" else 250  # averages of random colours are nearly equal
        print(end - begin if numpy.ptp(picture) > levels else "error\tno picture", flush=True)


if __name__ == "__main__":
    main()
