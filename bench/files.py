"""The image files that are measured: what is in them, and how they are written.

The writers stand here on their own, independent of the readers: that a thumbnail is right is found out by
comparing it with the naive reference on the places that the writer names.
"""

import contextlib
import dataclasses
import shutil
import struct

import numpy

RAW_CLASSES = {  # pixel format: value class of a .raw file
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
    """Rows of values as a detector gives them: spread around a mean, nothing special."""
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


def file_name(name):
    return name.replace(" ", "-").replace(",", "")


class Written:
    """Something on disk that is written into a folder and gone afterwards."""

    @contextlib.contextmanager
    def in_folder(self, folder):
        try:
            self.write(folder)
            yield self
        finally:
            path = folder / self.file
            shutil.rmtree(path) if path.is_dir() else path.unlink(missing_ok=True)


@dataclasses.dataclass
class Frame(Written):
    """One frame of a file. Offsets and strides are bytes; row 0 is the top of the picture."""

    name: str
    pixel_format: str
    width: int
    height: int
    kind: str = "mrc"  # the extension
    sections: int = 1  # of a stack, of which the middle one is filled and the others are holes
    padding: int = 0  # bytes after each row of a .raw file
    spread: int = 1  # pixels of the same size that are interleaved in a .raw file; the first is the frame's
    bottom_up: bool = False  # rows of a .raw file

    @property
    def file(self):
        return f"{file_name(self.name)}.{self.kind}"

    @property
    def pixel_stride(self):
        return pixel_bytes(self.pixel_format) * self.spread

    @property
    def row_bytes(self):
        return self.width * self.pixel_stride + self.padding

    @property
    def block_bytes(self):
        return self.height * self.row_bytes

    @property
    def block_position(self):
        if self.kind == "raw":
            return RAW_HEADER_BYTES
        return MRC_HEADER_BYTES + self.sections // 2 * self.block_bytes

    @property
    def flipped(self):
        return self.bottom_up or self.kind == "mrc"

    @property
    def row_stride(self):
        return -self.row_bytes if self.flipped else self.row_bytes

    @property
    def first_pixel(self):
        last_row = (self.height - 1) * self.row_bytes
        return self.block_position + (last_row if self.flipped else 0)

    def factor(self, edge):
        return max(self.width // edge, self.height // edge, 1)

    def output_bytes(self, edge):
        factor = self.factor(edge)
        channels = 3 if self.pixel_format in ("rgb", "bgr") else 1
        return -(-(self.width // factor) * channels // 4) * 4 * (self.height // factor)

    def header(self):
        if self.kind == "mrc":
            words = struct.pack("<4i", self.width, self.height, self.sections, MRC_MODES[self.pixel_format])
            return (words.ljust(208, b"\0") + b"MAP \x44\x44\0\0").ljust(MRC_HEADER_BYTES, b"\0")
        return b"QEL RawImage\0" + struct.pack(
            "<9i", 1, self.width, self.height, 1, 8 * pixel_bytes(self.pixel_format),
            RAW_CLASSES[self.pixel_format], self.first_pixel - self.block_position, self.pixel_stride,
            self.row_stride)

    def write(self, folder):
        generator = numpy.random.default_rng(1)
        with open(folder / self.file, "wb") as file:
            file.write(self.header())
            file.seek(self.block_position)
            rows_at_once = max(1, 2**22 // self.row_bytes)
            for row in range(0, self.height, rows_at_once):
                rows = min(rows_at_once, self.height - row)
                pixels = random_rows(self.pixel_format, self.width * self.spread, rows, generator)
                bytes_ = numpy.zeros((rows, self.row_bytes), "uint8")
                bytes_[:, : self.row_bytes - self.padding] = pixels.view("uint8")
                file.write(bytes_)
            file.truncate(self.block_position + self.block_bytes * (self.sections - self.sections // 2))


@dataclasses.dataclass
class Series(Written):
    """A .ser file of many small images, their offsets after the last of them."""

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
class Folder(Written):
    """A folder of small files of one kind."""

    kind: str
    count: int

    @property
    def file(self):
        return f"{self.count}-{self.kind}-files"

    @property
    def files(self):
        return [f"{self.file}/{number}.{self.kind}" for number in range(self.count)]

    @property
    def header_bytes(self):
        return {"mrc": MRC_HEADER_BYTES, "raw": RAW_HEADER_BYTES}[self.kind]

    def write(self, folder):
        """Pixels are a hole in each file: nobody is meant to read them."""
        (folder / self.file).mkdir(exist_ok=True)
        frame = Frame("any", "uint8", 512, 512, self.kind)
        for name in self.files:
            with open(folder / name, "wb") as file:
                file.write(frame.header())
                file.truncate(frame.block_position + frame.block_bytes)
