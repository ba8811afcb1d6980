"""Checks that the decoder module, and FFmpeg with it, is loaded by the first file that needs it and by nothing before; the module
of tags by none of these.

Usage: check_loading.py LIBRARY LINEAR_PCM_FILE COMPRESSED_FILE
"""
import ctypes
import pathlib
import re
import sys

library_path, plain, compressed = sys.argv[1:]
library = ctypes.CDLL(library_path)


def read(path):
    stream, done = ctypes.c_void_p(), ctypes.c_uint32()
    status = library.XStreamOpen(path.encode(), 0, 0, 0, None, None, ctypes.byref(stream))
    assert status == 0, f"{path}: status {status}"
    frames = ctypes.create_string_buffer(100 * 64)
    assert library.XStreamReadFramesSync(stream, ctypes.c_int64(0), 100, ctypes.byref(done), frames, None) == 0
    assert done.value == 100, done.value
    library.XStreamClose(stream)


def decoders():
    maps = pathlib.Path("/proc/self/maps").read_text(encoding="utf-8")
    return sorted(set(re.findall(r"\S*/lib(?:avcodec|avformat|ktfiles-decoders|tag|ktfiles-tags)[^/\n]*", maps)))


read(plain)
assert not decoders(), f"linear PCM loads {decoders()}"
read(compressed)
assert not [name for name in decoders() if "tag" in pathlib.Path(name).name], decoders()
assert len(decoders()) >= 3, f"only {decoders()} are there: the check sees nothing"
