"""The records of the public header, HostInterface.h and LanguageLibrary.h, for ctypes.

A test compiles the headers and compares every offset and size, so that neither can drift.
"""

import ctypes
from ctypes import c_char_p, c_float, c_int32, c_int64, c_uint32, c_uint64, c_void_p

OK = 0
FORMAT_NUMBER = 11
LANGUAGE_FORMAT_NUMBER = 1

# ParamDescriptor.type
BYTE, CHOICE, INT, FLOAT, COLOR, BOOL, MASK_RECT, POSITION = 1, 3, 4, 5, 7, 8, 13, 15

# EffectContext.pixelFormat, fieldSelector, stereoLayout
ARGB, AYUV = 0, 1
FRAME, FIRST_FIELD, SECOND_FIELD = 0, 1, 2
MONO, LEFT_HALF, RIGHT_HALF = 0, 1, 2

# EffectContext.cpuLevel: its upper 16 bits may ask for an option
WIDE_MAP = 0x4B590000


class ParamDescriptor(ctypes.Structure):
    _fields_ = [
        ("key", c_char_p),
        ("nameKey", c_char_p),
        ("descKey", c_char_p),
        ("minimum", c_void_p),
        ("maximum", c_void_p),
        ("defaultValue", c_void_p),
        ("value4", c_void_p),
        ("value5", c_void_p),
        ("value6", c_void_p),
        ("reserved48", c_uint64),
        ("reserved50", c_uint32),
        ("type", c_uint32),
        ("control", c_uint32),
        ("valueSize", c_uint32),
        ("flag", c_uint32),
        ("reserved64", c_uint32),
        ("reserved68", c_uint64),
        ("group", c_uint32),
        ("reserved74", c_uint32),
    ]


class EffectContext(ctypes.Structure):
    _fields_ = [
        ("reserved00", c_uint64),
        ("descriptor", c_void_p),
        ("notification", c_void_p),
        ("reserved18", c_uint64),
        ("instanceData", c_void_p),
        ("frame", c_void_p),
        ("pixelFormat", c_uint32),
        ("reserved34", c_uint32),
        ("fieldSelector", c_uint32),
        ("gpuMode", c_uint32),
        ("reserved40", c_uint32),
        ("stereoLayout", c_uint32),
        ("reserved48", c_uint64),
        ("gpuLibrary", c_void_p),
        ("reserved58", c_uint64 * 2),
        ("gpuDevice", c_void_p),
        ("reserved70", c_uint32),
        ("width", c_uint32),
        ("height", c_uint32),
        ("reserved7c", c_uint32 * 5),
        ("params", c_void_p),
        ("reserved98", c_uint64 * 3),
        ("displayAspectX", c_uint32),
        ("displayAspectY", c_uint32),
        ("position", c_int64),
        ("duration", c_int64),
        ("preview", c_uint32),
        ("previewFraction", c_float),
        ("threadCount", c_uint32),
        ("reservedD4", c_uint32 * 3),
        ("requestA", c_uint32),
        ("reservedE4", c_uint32 * 7),
        ("gpuVariant", c_uint32),
        ("cpuLevel", c_int32),
        ("reserved108", c_uint32),
        ("randomSeed", c_uint32),
        ("requestB", c_uint32),
        ("reserved114", c_uint32),
    ]


# A call lets go of the interpreter's lock, so that threads render side by side.
Callback = ctypes.CFUNCTYPE(c_uint32, ctypes.POINTER(EffectContext))
SetInputCallback = ctypes.CFUNCTYPE(c_uint32, c_uint32, ctypes.POINTER(EffectContext))


class EffectCallbacks(ctypes.Structure):
    _fields_ = [
        ("InitInstance", Callback),
        ("DestroyInstance", Callback),
        ("SetInputFrame", SetInputCallback),
        ("ProcessFrame", Callback),
        ("reserved20", Callback),
        ("BeginProcessing", Callback),
        ("EndProcessing", Callback),
        ("reserved38", Callback),
        ("reserved40", Callback),
    ]


class EffectProperties(ctypes.Structure):
    _fields_ = [
        (name, c_uint32)
        for name in (
            "family familyVariant property30 property34 inputCount property3c isFilter property44 "
            "property48 isTransition capabilities property54 property58 property5c property60 "
            "property64 familyClass"
        ).split()
    ]


class EffectDescriptor(ctypes.Structure):
    _fields_ = [
        ("identifier", c_char_p),
        ("nameKey", c_char_p),
        ("descKey", c_char_p),
        ("author", c_char_p),
        ("vendor", c_char_p),
        ("properties", EffectProperties),
        ("paramCount", c_uint32),
        ("params", ctypes.POINTER(ParamDescriptor)),
        ("module", c_void_p),
        ("instanceDataSize", c_uint32),
        ("reserved84", c_uint32),
        ("callbacks", EffectCallbacks),
        ("subclass", c_char_p),
    ]


class ModuleDescriptor(ctypes.Structure):
    _fields_ = [
        ("formatNumber", c_uint32),
        ("reserved04", c_uint32),
        ("nameKey", c_char_p),
        ("descKey", c_char_p),
        ("author", c_char_p),
        ("vendor", c_char_p),
        ("ModuleHandle", c_void_p),
        ("ResourceLibrary", c_void_p),
        ("effectCount", c_uint32),
        ("reserved3c", c_uint32),
        ("effects", ctypes.POINTER(EffectDescriptor)),
    ]


class LanguageText(ctypes.Structure):
    _fields_ = [("key", c_char_p), ("text", c_char_p)]


class LanguageDescriptor(ctypes.Structure):
    _fields_ = [
        ("formatNumber", c_uint32),
        ("textCount", c_uint32),
        ("language", c_char_p),
        ("texts", ctypes.POINTER(LanguageText)),
    ]


HOST_RECORDS = [
    ParamDescriptor,
    EffectContext,
    EffectCallbacks,
    EffectProperties,
    EffectDescriptor,
    ModuleDescriptor,
]
LANGUAGE_RECORDS = [LanguageText, LanguageDescriptor]
