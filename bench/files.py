"""The image files for the measurements."""

import contextlib
import dataclasses
import shutil
import struct

import numpy

RAW_CLASSES = {  # value class in the header of a .raw file, by pixel type
    "uint8": 0, "uint16": 0, "uint32": 0, "int8": 1, "int16": 1, "int32": 1, "float32": 2, "float64": 2,
    "rgb": 3, "bgr": 5, "complex64": 10, "complex128": 10,
}
MRC_MODES = {"uint8": 0, "int16": 1, "float32": 2, "complex64": 4, "uint16": 6, "rgb": 16}
MRC_HEADER_BYTES = 1024
RAW_HEADER_BYTES = 49
SER_ELEMENT_HEADER_BYTES = 50


def pixel_bytes(pixel_format):
    return 3 if pixel_format in ("rgb", "bgr") else numpy.dtype(pixel_format).itemsize


def random_rows(pixel_format, width, rows, generator):
    """Returns random rows with values like a detector's, spread around a mean."""
    if pixel_format in ("rgb", "bgr", "uint8", "int8"):
        channels = 3 if pixel_format in ("rgb", "bgr") else 1
        dtype = "int8" if pixel_format == "int8" else "uint8"
        return generator.integers(0, 256, (rows, width * channels), "uint8").view(dtype)
    values = generator.normal(0, 1, (rows, width)).astype("float32")
    if pixel_format.startswith("complex"):
        return (values + 1j * generator.normal(0, 1, (rows, width)).astype("float32")).astype(pixel_format)
    if pixel_format.startswith("float"):
        return (100 + 20 * values).astype(pixel_format)
    return numpy.clip(1000 + 100 * values, 0, 32767).astype(pixel_format)


class Input:
    """A file or folder that a measurement reads. in_folder writes it and deletes it afterwards."""

    @contextlib.contextmanager
    def in_folder(self, folder):
        try:
            self.write(folder)
            yield self
        finally:
            path = folder / self.file
            shutil.rmtree(path) if path.is_dir() else path.unlink(missing_ok=True)


@dataclasses.dataclass
class Frame(Input):
    """A file of one frame. Width and height are in pixels, other sizes and positions in bytes."""

    name: str
    pixel_format: str
    width: int
    height: int
    kind: str = "mrc"  # the file-name extension
    padding: int = 0  # in bytes, after each row of a .raw file
    spread: int = 1  # number of interleaved images in a .raw file; the frame is the first
    bottom_up: bool = False  # rows of a .raw file

    @property
    def file(self):
        return f"{self.name.replace(' ', '-')}.{self.kind}"

    @property
    def position(self):
        return RAW_HEADER_BYTES if self.kind == "raw" else MRC_HEADER_BYTES

    @property
    def row_bytes(self):
        return self.width * pixel_bytes(self.pixel_format) * self.spread + self.padding

    @property
    def block_bytes(self):
        return self.height * self.row_bytes

    def factor(self, edge):
        return max(self.width // edge, self.height // edge, 1)

    def header(self):
        if self.kind == "mrc":
            words = struct.pack("<4i", self.width, self.height, 1, MRC_MODES[self.pixel_format])
            return (words.ljust(208, b"\0") + b"MAP \x44\x44\0\0").ljust(MRC_HEADER_BYTES, b"\0")
        bytes_ = pixel_bytes(self.pixel_format)
        first_pixel, row_stride = ((self.height - 1) * self.row_bytes, -self.row_bytes) if self.bottom_up else (
            0, self.row_bytes)
        return b"QEL RawImage\0" + struct.pack("<9i", 1, self.width, self.height, 1, 8 * bytes_,
                                               RAW_CLASSES[self.pixel_format], first_pixel, bytes_ * self.spread,
                                               row_stride)

    def write(self, folder):
        generator = numpy.random.default_rng(1)
        with open(folder / self.file, "wb") as file:
            file.write(self.header())
            rows_at_once = max(1, 2**22 // self.row_bytes)
            for row in range(0, self.height, rows_at_once):
                rows = min(rows_at_once, self.height - row)
                pixels = random_rows(self.pixel_format, self.width * self.spread, rows, generator)
                bytes_ = numpy.zeros((rows, self.row_bytes), "uint8")
                bytes_[:, : self.row_bytes - self.padding] = pixels.view("uint8")
                file.write(bytes_)


@dataclasses.dataclass
class Series(Input):
    """A .ser file of many small images. The array of their offsets is at its end."""

    count: int
    edge: int = 32  # of an image of 16-bit pixels

    @property
    def file(self):
        return f"series-of-{self.count}.ser"

    @property
    def first_element(self):
        return len(self._header())

    @property
    def element_bytes(self):
        return SER_ELEMENT_HEADER_BYTES + 2 * self.edge**2

    def _header(self):
        dimension = struct.pack("<Iddiii", self.count, 0, 1, 0, 0, 0)
        size = 30 + len(dimension)
        return struct.pack("<HHHIIIIII", 0x4949, 0x0197, 0x0210, 0x4122, 0x4152, self.count, self.count,
                           size + self.count * self.element_bytes, 1) + dimension

    def write(self, folder):
        calibration = struct.pack("<ddi", 0, 1, 0)
        unsigned_16_bits = 2
        header = 2 * calibration + struct.pack("<hII", unsigned_16_bits, self.edge, self.edge)
        element = header + numpy.arange(self.edge**2, dtype="<u2").tobytes()
        offsets = self.first_element + numpy.arange(self.count, dtype="<u4") * self.element_bytes
        with open(folder / self.file, "wb") as file:
            file.write(self._header())
            at_once = 10000
            for first in range(0, self.count, at_once):
                file.write(element * min(at_once, self.count - first))
            file.write(offsets.astype("<u4"))  # of the images
            file.write(bytes(4 * self.count))  # of their tags


@dataclasses.dataclass
class Folder(Input):
    """A folder of small .mrc files. No measurement reads their pixels, which are a hole in each sparse file."""

    count: int

    @property
    def file(self):
        return f"folder-of-{self.count}"

    @property
    def files(self):
        return [f"{self.file}/{number}.mrc" for number in range(self.count)]

    def write(self, folder):
        (folder / self.file).mkdir(exist_ok=True)
        frame = Frame("any", "uint8", 512, 512)
        for name in self.files:
            with open(folder / name, "wb") as file:
                file.write(frame.header())
                file.truncate(frame.position + frame.block_bytes)
