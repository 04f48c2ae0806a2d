#!/usr/bin/env python3
"""Pink noise through an engine with one equaliser band raised, read off in octaves by the library's own analyser."""
import ctypes
import math
import struct
import sys

PINK_NOISE, ENABLE, READ, BEHIND_ENGINE = -14, -7, -9, 1  # commands and an analyser of VXDSPAPI.h

class IOFormat(ctypes.Structure):
    _fields_ = [("channels", ctypes.c_int32), ("mask", ctypes.c_uint32), ("frames", ctypes.c_int32), ("rate", ctypes.c_int32),
                ("slots", ctypes.c_uint8 * 8), ("speakers", ctypes.c_uint8 * 8)]

class ProcessBuffers(ctypes.Structure):
    _fields_ = [("channels", ctypes.c_void_p), ("reserved", ctypes.c_uint64), ("silent", ctypes.c_int32), ("unused", ctypes.c_uint32)]

vx = ctypes.CDLL(sys.argv[1] if len(sys.argv) > 1 else "libVXCOMN64U.so")
vx.VXDSPAPI_InitializeLibrary.restype = ctypes.c_void_p
host = ctypes.c_void_p(vx.VXDSPAPI_InitializeLibrary(b"SampleEngine", None, 0, None, None, 48000, 0))
if not host: sys.exit("no such engine, or it declines")
stereo = IOFormat(2, 3, 480, 48000, (0, 1), (1, 2))
vx.VXDSPAPI_SetIOFormat(host, ctypes.byref(stereo), ctypes.byref(stereo))
planes = [(ctypes.c_float * 512)() for _ in range(8)]
channels = (ctypes.c_void_p * 8)(*map(ctypes.addressof, planes))
buffers = ProcessBuffers(ctypes.addressof(channels), 0, 0, 0)

def command(number, data, size=0):
    output = ctypes.create_string_buffer(max(size, 1))
    written = vx.VXDSPAPI_ReadWriteData(host, 0, number, data, len(data), output)
    return output.raw[:written]

def octaves(gain_db):
    band = struct.pack("<Bfff", 1, 1000, 1, gain_db)  # a bell: type, Hz, quality, dB
    vx.VXDSPAPI_SetParameter(host, 5, 123, 0, band, len(band))
    for _ in range(100): vx.VXDSPAPI_Process(host, ctypes.byref(buffers), ctypes.byref(stereo), ctypes.byref(stereo))
    address, = struct.unpack("<Qx", command(READ, struct.pack("<BBBIi", BEHIND_ENGINE, 0, 1, 32768, 1), 9))
    return [10 * math.log10(max(power, 1e-20)) for power in (ctypes.c_float * 11).from_address(address)]

for number, data in ((PINK_NOISE, b"\1"), (ENABLE, struct.pack("BB", BEHIND_ENGINE, 1))): command(number, data)
for octave, (flat, raised) in enumerate(zip(octaves(0), octaves(9))): print(f"{15.625 * 2 ** octave:8.1f} Hz {raised - flat:+6.2f} dB")
