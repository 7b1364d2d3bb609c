"""What is aimed at: ratios to the bare read of the same bytes (must, reach for) and nanoseconds a pixel."""

NARROW = ("uint8", "int8", "uint16", "int16", "rgb", "bgr")
WIDE = ("int32", "uint32", "float32")


def ratio_goal(pixel_format, factor):
    if pixel_format in NARROW:
        return (1.8, 1.3) if factor >= 16 else (2.2, 1.5)
    if pixel_format in WIDE:
        return (2.0, 1.5) if factor >= 16 else None
    return {"float64": (1.7, 1.3), "complex64": (11, 5.5), "complex128": (6.5, 3)}[pixel_format]


def kernel_goal(pixel_format, factor):
    """SSE2 and AVX2 where they differ: must and reach for."""
    if pixel_format in NARROW and factor < 16:
        return (0.17, 0.17)
    goals = {"uint8": (0.035, 0.035), "uint16": (0.07, 0.07), "int16": (0.07, 0.07), "int32": (0.18, 0.18),
             "float32": (0.18, 0.18), "float64": (0.20, 0.20), "complex64": (3.7, 1.9),
             "complex128": (3.6, 1.9)}
    if pixel_format in WIDE and factor < 16:
        return None
    return goals.get(pixel_format)


MEMORY_GOAL = (2 * 2**20, 2**20)  # bytes above idle and the output
SERIES_GOAL = (1.5, 1.1)
OTHERS_GOAL = 3  # times faster than the fastest of them in process


def verdict(value, goal):
    """Whether a value, the smaller the better, reaches its goal of (must, reach for)."""
    if goal is None:
        return "no goal"
    must, reach = goal
    return "reached" if value <= reach else "met" if value <= must else "NOT MET"
