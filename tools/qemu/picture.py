"""A PNG file of a display that Xvfb keeps in a file (its option -fbdir), with nothing but the standard library."""
import os
import struct
import zlib

HEADER_WORDS = 25


def chunk(name, data):
    return struct.pack(">I", len(data)) + name + data + struct.pack(">I", zlib.crc32(name + data))


def save(folder, path):
    """Writes what the first screen of the display shows; `folder` is the display's -fbdir."""
    with open(os.path.join(folder, "Xvfb_screen0"), "rb") as f:
        data = f.read()
    header = struct.unpack(">%dI" % HEADER_WORDS, data[:4 * HEADER_WORDS])
    header_bytes, width, height, is_big = header[0], header[4], header[5], header[7]
    bits_per_pixel, stride, colours = header[11], header[12], header[19]
    if bits_per_pixel != 32:
        raise ValueError("a display of %d bits per pixel" % bits_per_pixel)
    start = header_bytes + 12 * colours
    rows = []
    for y in range(height):
        row = data[start + y * stride:start + y * stride + 4 * width]
        picture = bytearray(3 * width)
        for channel in range(3):  # blue, green, red, nothing; in the display's order of bytes
            picture[channel::3] = row[channel + 1::4] if is_big else row[2 - channel::4]
        rows.append(b"\0" + bytes(picture))
    with open(path, "wb") as f:
        f.write(b"\x89PNG\r\n\x1a\n" + chunk(b"IHDR", struct.pack(">IIBBBBB", width, height, 8, 2, 0, 0, 0)) +
                chunk(b"IDAT", zlib.compress(b"".join(rows))) + chunk(b"IEND", b""))
