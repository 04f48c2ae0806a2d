#!/usr/bin/env python3
"""What a panel does to stay true: waits for changes of an endpoint's effects, whoever makes them, and prints each.

    panel_watch.py [LIBRARY [ENDPOINT-INDEX [CHANGES]]]
"""
import ctypes
import struct
import sys
import uuid

RECORD = struct.Struct("<16sQiiiIB7x")  # source, stamp, component, parameter, channel, size of the data, transient
BASS = 1  # USER_PARAM_ID_BASS_LEVEL

vx = ctypes.CDLL(sys.argv[1] if len(sys.argv) > 1 else "libVXCOMN64U.so")
for name in ("Initialize", "Free", "SetAPOType", "GetUserParameter", "ReceiveParamChange"):
    getattr(vx, "VXAPOCOMAPI_" + name).argtypes = [ctypes.c_void_p] if name in ("Free",) else None
vx.VXAPOCOMAPI_Initialize.restype = ctypes.c_void_p
vx.VXAPOCOMAPI_GetUserParameter.restype = ctypes.c_float

panel = ctypes.c_void_p(vx.VXAPOCOMAPI_Initialize(int(sys.argv[2]) if len(sys.argv) > 2 else 0))
if not panel or not vx.VXAPOCOMAPI_SetAPOType(panel, b"EFX"):
    sys.exit(f"no such endpoint: error {vx.VXAPOCOMAPI_GetLastError(panel)}")
blob, size, count = ctypes.c_void_p(), ctypes.c_uint32(), ctypes.c_uint32()

def receive(timeout_ms):
    if not vx.VXAPOCOMAPI_ReceiveParamChange(panel, *map(ctypes.byref, (blob, size, count)), ctypes.c_uint32(timeout_ms), 0): return
    data, at = ctypes.string_at(blob, size.value), 0
    for _ in range(count.value):
        source, stamp, component, parameter, channel, length, transient = RECORD.unpack_from(data, at)
        at += RECORD.size + length
        yield uuid.UUID(bytes_le=source), component, parameter, data[at - length:at]

while any(True for _ in receive(0)): pass  # what stands in the store already
print("watching", flush=True)
left = int(sys.argv[3]) if len(sys.argv) > 3 else -1
while left != 0:
    for source, component, parameter, value in receive(1000):
        print(f"{component},{parameter} = {value.hex()} by {source}; bass {vx.VXAPOCOMAPI_GetUserParameter(panel, BASS):.3f}", flush=True)
        left -= 1
