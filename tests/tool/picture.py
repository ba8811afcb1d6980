"""Pictures read back for the tests beside this file: PNG files by libpng, SVG files by their paths."""
import ctypes
import ctypes.util
import re
import xml.etree.ElementTree as ElementTree

FORMAT_RGBA = 3


class Image(ctypes.Structure):  # png_image of <png.h>
    _fields_ = [("opaque", ctypes.c_void_p), *((name, ctypes.c_uint32) for name in (
        "version", "width", "height", "format", "flags", "colormap_entries", "warning_or_error")),
        ("message", ctypes.c_char * 64)]


libpng = ctypes.CDLL(ctypes.util.find_library("png16") or "libpng16.so.16")
libpng.png_image_begin_read_from_memory.argtypes = [ctypes.c_void_p, ctypes.c_char_p, ctypes.c_size_t]
libpng.png_image_finish_read.argtypes = [ctypes.c_void_p, ctypes.c_void_p, ctypes.c_void_p, ctypes.c_int32,
                                         ctypes.c_void_p]


def pixels_of_png(data):
    """Bytes of red, green, blue and alpha of each pixel, and the pixels in a row."""
    image = Image(version=1)
    assert libpng.png_image_begin_read_from_memory(ctypes.byref(image), data, len(data)), image.message
    image.format = FORMAT_RGBA
    pixels = ctypes.create_string_buffer(image.width * image.height * 4)
    assert libpng.png_image_finish_read(ctypes.byref(image), None, pixels, image.width * 4, None), image.message
    return pixels.raw[:-1], image.width


def decoded_png(data):
    """Rows of (red, green, blue, alpha)."""
    flat, width = pixels_of_png(data)
    return [[tuple(flat[at:at + 4]) for at in range(row, row + width * 4, 4)] for row in range(0, len(flat), width * 4)]


class WhiteOnBlack:
    """The wave of a picture drawn with `COLORS`: how much of each pixel it covers, 0 to 1."""
    COLORS = "ffffff,000000,ff0000"

    def __init__(self, data):
        self.rows = decoded_png(data)
        self.width, self.height = len(self.rows[0]), len(self.rows)

    def column(self, x):
        return [row[x][1] / 255 for row in self.rows]

    def extent(self, x):
        """Where the wave begins and ends in a column, to the part of a pixel, whatever the tone of its peaks."""
        column = self.column(x)
        covered = [y for y, value in enumerate(column) if value > 0.02]
        first, last = covered[0], covered[-1]
        if first == last:
            return first + (1 - column[first]) / 2, first + (1 + column[first]) / 2
        above = column[first] / max(column[first], column[first + 1])
        below = column[last] / max(column[last], column[last - 1])
        return first + 1 - above, last + below


def svg_waves(data):
    """The (x, y) of each path that is filled, and the texts."""
    root = ElementTree.fromstring(data)
    paths = []
    for path in root.iter("{http://www.w3.org/2000/svg}path"):
        if "fill" not in path.attrib:
            continue
        x = y = 0.0
        corners = []
        for command, values in re.findall(r"([MLHV])([-0-9. ]+)", path.attrib["d"]):
            numbers = [float(value) for value in values.split()]
            x, y = (x, numbers[0]) if command == "V" else (numbers[0], y) if command == "H" else numbers
            corners.append((x, y))
        paths.append(corners)
    return paths, [text.text for text in root.iter("{http://www.w3.org/2000/svg}text")]
