// The optional image decoder component, which a host may have registered with COM.
//
// Its interfaces are records of function pointers: we call the slots named here and know nothing
// else of it. A status of 0 or above is success.
#pragma once

#include <cstdint>

#include <windows.h>

#include <objbase.h>

namespace kyv {

inline constexpr CLSID kExternalDecoderClass = {
    0xF660FBC0, 0x5936, 0x11DD, {0xAE, 0x16, 0x08, 0x00, 0x20, 0x0C, 0x9A, 0x66}};
inline constexpr IID kExternalDecoderInterface = {
    0xFF7C86C0, 0x5936, 0x11DD, {0xAE, 0x16, 0x08, 0x00, 0x20, 0x0C, 0x9A, 0x66}};
inline constexpr IID kExternalDecoderOptionsInterface = {
    0x6D8AEAC6, 0xACA4, 0x4379, {0x9E, 0x03, 0xD4, 0x5C, 0xAD, 0x91, 0xA7, 0x79}};

// The option number under which an image's decode option is passed.
inline constexpr int32_t kExternalDecoderOption = 2;

struct ExternalDecoderTable;
struct ExternalDecoderOptionsTable;

struct ExternalDecoder {
    const ExternalDecoderTable* table;
};

struct ExternalDecoderOptions {
    const ExternalDecoderOptionsTable* table;
};

struct ExternalDecoderTable {
    HRESULT (*QueryInterface)(ExternalDecoder* self, const IID* iid, void** object); // slot 0
    uint32_t (*AddRef)(ExternalDecoder* self);                                       // slot 1
    uint32_t (*Release)(ExternalDecoder* self);                                      // slot 2
    void* slot3;
    HRESULT (*Open)(ExternalDecoder* self, const wchar_t* path); // slot 4
    void* slot5;
    void* slot6;
    int32_t (*GetHeight)(ExternalDecoder* self); // slot 7
    int32_t (*GetWidth)(ExternalDecoder* self);  // slot 8
    void* slot9;
    void* slot10;
    void* slot11;
    HRESULT(*GetPixels)
    (ExternalDecoder* self, uint8_t* buffer, int32_t width, int32_t height,
     int32_t pitch); // slot 12: B, G, R, A, top down
};

struct ExternalDecoderOptionsTable {
    HRESULT (*QueryInterface)(ExternalDecoderOptions* self, const IID* iid, void** object);
    uint32_t (*AddRef)(ExternalDecoderOptions* self);
    uint32_t (*Release)(ExternalDecoderOptions* self); // slot 2
    void* slot3;
    HRESULT (*SetOption)(ExternalDecoderOptions* self, int32_t option, int32_t* value); // slot 4
};

} // namespace kyv
