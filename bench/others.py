"""Makes thumbnails the way that is at hand without this project, and measures them on command.

Usage: others.py NAME, one of the functions at the end. Speaks the protocol of processes.Worker:

  thumbnail FACTOR FORMAT WIDTH HEIGHT POSITION FILE

answers the nanoseconds from the file to the bytes of a grey picture, reduced by FACTOR and stretched to 0..255.
Every way reads the pixels where they lie in the file, and makes the values of a block one by its mean.
"""

import ctypes
import sys
import time
from ctypes.util import find_library

import mrcfile
import numpy


def stretched(means):
    low, high = means.min(), means.max()
    return ((means - low) * (255 / (high - low))).astype("uint8")


def mapped(file, position, pixel_format, width, height):
    return numpy.memmap(file, pixel_format, "r", position, (height, width))


def block_means(frame, factor):
    """The block mean as it is usually written."""
    rows, columns = (size // factor for size in frame.shape)
    whole = frame[: rows * factor, : columns * factor]
    return whole.reshape(rows, factor, columns, factor).mean(axis=(1, 3))


def block_means_by_axis(frame, factor):
    """The same, faster: one axis after the other."""
    rows, columns = (size // factor for size in frame.shape)
    by_rows = frame[: rows * factor, : columns * factor].reshape(rows, factor, -1).mean(axis=1)
    return by_rows.reshape(rows, columns, factor).mean(axis=2)


def numpy_mean(factor, pixel_format, width, height, position, file):
    return stretched(block_means(mapped(file, position, pixel_format, width, height), factor))


def numpy_mean_by_axis(factor, pixel_format, width, height, position, file):
    return stretched(block_means_by_axis(mapped(file, position, pixel_format, width, height), factor))


def mrcfile_mean(factor, pixel_format, width, height, position, file):
    with mrcfile.mmap(file, "r") as mrc:
        return stretched(block_means(mrc.data, factor))


def mrcfile_mean_by_axis(factor, pixel_format, width, height, position, file):
    with mrcfile.mmap(file, "r") as mrc:
        return stretched(block_means_by_axis(mrc.data, factor))


class Vips:
    """libvips through its C interface: no Python in its loops, as many threads as it takes by itself, and read
    from top to bottom, which is the fastest way."""

    FORMATS = {"uint16": 2, "int16": 3, "float32": 6}  # VipsBandFormat
    SEQUENTIAL = 1  # VipsAccess

    def __init__(self):
        self._vips = ctypes.CDLL("libvips.so.42")
        self._vips.vips_error_buffer.restype = ctypes.c_char_p
        self._vips.vips_image_write_to_memory.restype = ctypes.c_void_p
        self._glib = ctypes.CDLL("libglib-2.0.so.0")
        self._gobject = ctypes.CDLL("libgobject-2.0.so.0")
        self._check(self._vips.vips_init(b"bench"))
        self._vips.vips_cache_set_max(0)  # a result must not be taken from the round before

    def _check(self, status):
        if status != 0:
            raise RuntimeError(self._vips.vips_error_buffer().decode())

    def _run(self, operation, *arguments):
        image = ctypes.c_void_p()
        self._check(operation(*arguments[:1], ctypes.byref(image), *arguments[1:], None))
        return image

    def __call__(self, factor, pixel_format, width, height, position, file):
        vips = self._vips
        frame = self._run(vips.vips_rawload, file.encode(), width, height, 1, b"offset",
                          ctypes.c_uint64(position), b"format", self.FORMATS[pixel_format], b"access",
                          self.SEQUENTIAL)
        shrunk = self._run(vips.vips_shrink, frame, ctypes.c_double(factor), ctypes.c_double(factor))
        vips.vips_image_copy_memory.restype = ctypes.c_void_p
        means = ctypes.c_void_p(vips.vips_image_copy_memory(shrunk))
        grey = self._run(vips.vips_scale, means)
        size = ctypes.c_size_t()
        pixels = vips.vips_image_write_to_memory(grey, ctypes.byref(size))
        picture = ctypes.string_at(pixels, size.value)
        self._glib.g_free(ctypes.c_void_p(pixels))
        for image in (grey, means, shrunk, frame):
            self._gobject.g_object_unref(image)
        return numpy.frombuffer(picture, "uint8")


class Magick:
    """ImageMagick through its C interface."""

    def __init__(self):
        self._wand = ctypes.CDLL(find_library("MagickWand-7.Q16") or find_library("MagickWand-6.Q16"))
        self._wand.NewMagickWand.restype = ctypes.c_void_p
        self._wand.MagickWandGenesis()

    def __call__(self, factor, pixel_format, width, height, position, file):
        call = self._wand
        wand = ctypes.c_void_p(call.NewMagickWand())
        size = numpy.dtype(pixel_format).itemsize
        size_t = ctypes.c_size_t
        call.MagickSetDepth(wand, size_t(8 * size))
        call.MagickSetSizeOffset(wand, size_t(width), size_t(height), ctypes.c_ssize_t(position))
        call.MagickSetOption(wand, b"endian", b"LSB")
        if pixel_format.startswith("float"):
            call.MagickSetOption(wand, b"quantum:format", b"floating-point")
            call.MagickSetOption(wand, b"quantum:minimum", b"0")  # values are clipped to a range
            call.MagickSetOption(wand, b"quantum:maximum", b"200")
        if not call.MagickReadImage(wand, b"gray:" + file.encode()):
            raise RuntimeError(f"ImageMagick cannot read {file}")
        call.MagickScaleImage(wand, size_t(width // factor), size_t(height // factor))
        call.MagickAutoLevelImage(wand)
        picture = numpy.empty((height // factor, width // factor), "uint8")
        char_pixel = 1
        call.MagickExportImagePixels(wand, ctypes.c_ssize_t(0), ctypes.c_ssize_t(0), size_t(width // factor),
                                     size_t(height // factor), b"I", char_pixel,
                                     picture.ctypes.data_as(ctypes.c_void_p))
        call.DestroyMagickWand(wand)
        return picture


WAYS = {
    "numpy, both axes": lambda: numpy_mean,
    "numpy, axis by axis": lambda: numpy_mean_by_axis,
    "mrcfile, both axes": lambda: mrcfile_mean,
    "mrcfile, axis by axis": lambda: mrcfile_mean_by_axis,
    "libvips": Vips,
    "ImageMagick": Magick,
}


def main():
    thumbnail = WAYS[sys.argv[1]]()
    for line in sys.stdin:
        _, factor, pixel_format, width, height, position, file = line.rstrip("\n").split("\t")
        begin = time.perf_counter_ns()
        picture = thumbnail(int(factor), pixel_format, int(width), int(height), int(position), file)
        end = time.perf_counter_ns()
        print(end - begin if numpy.ptp(picture) > 250 else "error\tno picture", flush=True)


if __name__ == "__main__":
    main()
