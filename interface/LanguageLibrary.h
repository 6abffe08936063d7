// The language libraries: display texts for the keys in the module's records.
//
// A library holds the texts of one language and lies beside the module: KyvDsp_ENU.DLL,
// KyvDsp_DEU.DLL and so on beside KyvDsp.dll, libKyvDsp_ENU.DLL beside libKyvDsp.so.
// KYV_DSP_InitModule loads the one that suits the user and puts its handle into
// ModuleDescriptor::ResourceLibrary. Look the functions below up in that handle. Where there is no
// library for the user's language the handle is the module's own, which does not export them: show
// names of your own then.
//
// Keys: the nameKey and descKey fields of the records, an effect's subclass (its category), and for
// the labels of a choice list the name key, ";" and the label. The name key of a list ends before
// its first ";":
//
//   "IDS_Vi_Param_MaskType_Name;box;circle"    in the record
//   "IDS_Vi_Param_MaskType_Name"               the parameter's name
//   "IDS_Vi_Param_MaskType_Name;box"           the first choice
//
// Texts: UTF-8, zero-terminated, one line, neither empty nor marked up. They belong to the library
// and stay valid until it is released (by KYV_DSP_DeInitModule): copy what is to live longer. All
// data is constant; any thread may read it at any time.
//
// A library of another maker needs the two exports and the right name, nothing else.
#pragma once

#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
#define KYV_NOEXCEPT noexcept
extern "C" {
#else
#define KYV_NOEXCEPT
#endif

enum {
    kKyvLanguageFormatNumber = 1, // LanguageDescriptor::formatNumber of this interface
};

typedef struct LanguageText {
    const char* key;  // 0x00
    const char* text; // 0x08
} LanguageText;

typedef struct LanguageDescriptor {
    uint32_t formatNumber;     // 0x00  kKyvLanguageFormatNumber
    uint32_t textCount;        // 0x04
    const char* language;      // 0x08  a BCP 47 tag: "en-US", "de", "fr"
    const LanguageText* texts; // 0x10  textCount records in no particular order, each key once
} LanguageDescriptor;

// The text of a key; null when the library has none, or for a null key.
typedef const char* (*KyvLanguageTextFunction)(const char* key)KYV_NOEXCEPT;
// Everything that the library holds. Never null.
typedef const LanguageDescriptor* (*KyvLanguageFunction)(void)KYV_NOEXCEPT;

#define KYV_LANGUAGE_TEXT_NAME "KYV_DSP_LanguageText"
#define KYV_LANGUAGE_NAME "KYV_DSP_Language"

#ifdef __cplusplus
} // extern "C"
#define KYV_AT(record, field, offset) static_assert(offsetof(record, field) == (offset), #field)
#else
#define KYV_AT(record, field, offset) _Static_assert(offsetof(record, field) == (offset), #field)
#endif

KYV_AT(LanguageText, text, 0x08);
KYV_AT(LanguageDescriptor, textCount, 0x04);
KYV_AT(LanguageDescriptor, language, 0x08);
KYV_AT(LanguageDescriptor, texts, 0x10);

#undef KYV_AT
