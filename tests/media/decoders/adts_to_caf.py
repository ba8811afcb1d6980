"""Puts the packets of an ADTS file into a CAF file: adts_to_caf.py FROM TO VALID_FRAMES. The priming is 1,024 frames."""
import struct
import sys

source, target, valid = sys.argv[1], sys.argv[2], int(sys.argv[3])
with open(source, "rb") as file:
    data = file.read()

packets, at = [], 0
while at + 7 <= len(data):
    size = (data[at + 3] & 3) << 11 | data[at + 4] << 3 | data[at + 5] >> 5
    packets.append(data[at + (7 if data[at + 1] & 1 else 9):at + size])
    at += size
rate_index, channels = data[2] >> 2 & 15, (data[2] & 1) << 2 | data[3] >> 6
rate = [96000, 88200, 64000, 48000, 44100, 32000, 24000, 22050, 16000, 12000, 11025, 8000][rate_index]
config = struct.pack(">H", 2 << 11 | rate_index << 7 | channels << 3)  # AudioSpecificConfig of AAC-LC


def descriptor(tag, body):
    return bytes([tag, len(body)]) + body


decoder = descriptor(4, struct.pack(">BBxxxII", 0x40, 0x15, 0, 0) + descriptor(5, config))
cookie = descriptor(3, b"\0\0\0" + decoder + descriptor(6, b"\2"))


def number(value):
    digits = [value & 127]
    while value := value >> 7:
        digits.insert(0, value & 127 | 128)
    return bytes(digits)


def chunk(kind, body):
    return kind + struct.pack(">q", len(body)) + body


table = struct.pack(">qqii", len(packets), valid, 1024, len(packets) * 1024 - 1024 - valid)
with open(target, "wb") as file:
    file.write(b"caff" + struct.pack(">HH", 1, 0))
    file.write(chunk(b"desc", struct.pack(">d4sIIIII", rate, b"aac ", 0, 0, 1024, channels, 0)))
    file.write(chunk(b"kuki", cookie))
    file.write(chunk(b"pakt", table + b"".join(number(len(packet)) for packet in packets)))
    file.write(chunk(b"data", b"\0\0\0\0" + b"".join(packets)))
