// A language library: one table of texts, searched by key. KYV_TEXT_ROWS is the file made of the
// table.
#include "interface/LanguageLibrary.h"

#include <string.h>

#define KYV_LANGUAGE(tag) static const char kLanguageTag[] = tag;
#define KYV_TEXT(textKey, words)
#include KYV_TEXT_ROWS
#undef KYV_LANGUAGE
#undef KYV_TEXT

#define KYV_LANGUAGE(tag)
#define KYV_TEXT(textKey, words) {.key = textKey, .text = words},
static const LanguageText kTexts[] = {
#include KYV_TEXT_ROWS
};

static const LanguageDescriptor kLanguage = {
    .formatNumber = kKyvLanguageFormatNumber,
    .textCount = sizeof kTexts / sizeof kTexts[0],
    .language = kLanguageTag,
    .texts = kTexts,
};

#define KYV_EXPORT __attribute__((visibility("default")))

KYV_EXPORT const LanguageDescriptor* KYV_DSP_Language(void);
KYV_EXPORT const char* KYV_DSP_LanguageText(const char* key);

const LanguageDescriptor* KYV_DSP_Language(void) {
    return &kLanguage;
}

// There are about a hundred texts and hosts ask for each once: a plain search will do.
const char* KYV_DSP_LanguageText(const char* key) {
    for (uint32_t i = 0; key && i < kLanguage.textCount; ++i) {
        if (strcmp(kTexts[i].key, key) == 0) {
            return kTexts[i].text;
        }
    }
    return NULL;
}
