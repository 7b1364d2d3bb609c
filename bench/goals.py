"""What is aimed at. A goal is a pair: what must be met, and what is reached for; the smaller the better."""

NARROW = ("uint8", "int8", "uint16", "int16", "rgb", "bgr")
WIDE = ("int32", "uint32", "float32")

REACHED, MET, MISSED = "reached", "met", "MISSED"

MEMORY = (2 * 2**20, 2**20)  # bytes above idle and the output
SERIES = (1.5, 1.1)  # times one positioned read of each header
STACK = (1.1, 1.05)  # times the same frame in a file of its own
OTHERS = 3  # times faster than the fastest of them in process


def way(pixel_format, factor):
    """Of the whole way from the file to the bitmap, in times of the bare read of the same bytes."""
    if pixel_format in NARROW:
        return (1.8, 1.3) if factor >= 16 else (2.2, 1.5)
    if pixel_format in WIDE:
        return (2.0, 1.5) if factor >= 16 else None
    return {"float64": (1.7, 1.3), "complex64": (11, 5.5), "complex128": (6.5, 3)}[pixel_format]


def kernel(pixel_format, factor):
    """Of the reduction alone, in nanoseconds a pixel. Complex: with SSE2, and with AVX2."""
    if pixel_format in NARROW and factor < 16:
        return (0.17, 0.17)
    if pixel_format in WIDE and factor < 16:
        return None
    return {
        "uint8": (0.035, 0.035),
        "uint16": (0.07, 0.07),
        "int16": (0.07, 0.07),
        "int32": (0.18, 0.18),
        "float32": (0.18, 0.18),
        "float64": (0.20, 0.20),
        "complex64": (3.7, 1.9),
        "complex128": (3.6, 1.9),
    }.get(pixel_format)


def verdict(value, goal):
    """Empty without a goal."""
    if goal is None:
        return ""
    must, reach = goal
    return REACHED if value <= reach else MET if value <= must else MISSED


def times_faster_verdict(times, goal):
    return "" if goal is None else MET if times >= goal else MISSED
