// Effects and parameters by name.
#include "hosting/Names.h"

#include <algorithm>
#include <atomic>
#include <charconv>
#include <utility>

#include "hosting/Error.h"
#include "hosting/Suggest.h"
#include "hosting/Text.h"
#include "interface/LanguageLibrary.h"
#include "platform/Library.h"

namespace kyvhosting {
namespace {

bool IsUpper(char c) {
    return c >= 'A' && c <= 'Z';
}
bool IsLower(char c) {
    return c >= 'a' && c <= 'z';
}
bool IsDigit(char c) {
    return c >= '0' && c <= '9';
}

void DropPrefix(std::string_view& text, std::string_view prefix) {
    if (text.starts_with(prefix)) {
        text.remove_prefix(prefix.size());
    }
}

// "Vi", "Pi", "Tr" or "Co" of a key; empty when it has none.
std::string_view FamilyTag(std::string_view key) {
    DropPrefix(key, "IDS_");
    DropPrefix(key, "DSP_");
    return key.size() > 3 && IsUpper(key[0]) && IsLower(key[1]) && key[2] == '_' ? key.substr(0, 2)
                                                                                 : "";
}

// Whether a word ends before text[i]: "min|Size", "3D|Depth", "Color|1".
bool WordEndsBefore(std::string_view text, size_t i) {
    const char last = text[i - 1];
    if (IsUpper(text[i])) {
        const bool newWord = i + 1 < text.size() && IsLower(text[i + 1]);
        return IsLower(last) || (IsUpper(last) && newWord);
    }
    return IsDigit(text[i]) && IsLower(last);
}

// Whether text is a part of the name that can stand for it: shorter ones are in too many.
bool IsPart(std::string_view text, std::string_view name) {
    constexpr size_t kLeastLetters = 2;
    const std::string part = Normalized(text);
    return part.size() >= kLeastLetters && Normalized(name).find(part) != std::string::npos;
}

// The end of "no effect x": the nearest name, if one is near, and where all are.
std::string WithNearest(const std::string& nearest, const std::string& where) {
    if (nearest.empty()) {
        return where.empty() ? "" : "; " + where;
    }
    return "; the nearest is " + Quoted(nearest) + (where.empty() ? "" : " (" + where + ")");
}

std::string_view WithoutLabels(std::string_view nameKey) {
    return nameKey.substr(0, nameKey.find(';'));
}

// The name as its key alone gives it: "Temperature".
std::string BareEffectName(const EffectDescriptor& effect) {
    std::string words = WordsOfKey(effect.nameKey);
    // A number at the end counts revisions of the effect and tells a user nothing.
    while (!words.empty() && (IsDigit(words.back()) || words.back() == ' ')) {
        words.pop_back();
    }
    return words;
}

// That with what keys leave out because the family says it.
std::string NameOfKey(const EffectDescriptor& effect) {
    const std::string bare = BareEffectName(effect);
    const std::string_view family = FamilyTag(effect.nameKey);
    if (family == "Co" && bare.find(' ') == std::string::npos) {
        return "Color " + Lower(bare);
    }
    if (family == "Tr" && bare.find("transition") == std::string::npos) {
        return bare + " transition";
    }
    return family == "Pi" ? bare + " picture-in-picture" : bare;
}

// Of UseTextsBeside.
std::atomic<KyvLanguageTextFunction> g_textsBeside = nullptr;

} // namespace

void UseTextsBeside(const std::filesystem::path& module) {
    const auto english = std::filesystem::path("ENU").native();
    for (const kyv::NativeString& language : {kyv::AbbreviatedLanguageName(), english}) {
        if (g_textsBeside.load()) {
            return;
        }
        std::filesystem::path file = module.parent_path() / module.stem();
        file += "_";
        file += language;
        file += ".DLL";
        if (!kyv::FileExists(file.native())) {
            continue;
        }
        if (const kyv::LibraryHandle library = kyv::OpenLibrary(file.native())) {
            g_textsBeside = reinterpret_cast<KyvLanguageTextFunction>(
                kyv::FindSymbol(library, KYV_LANGUAGE_TEXT_NAME));
        }
    }
}

std::string SectionOf(const EffectDescriptor& effect, uint32_t param) {
    if (effect.properties.family != EffectFamily_PictureInPicture) {
        return {};
    }
    // Each begins with its switch.
    static constexpr std::pair<std::string_view, const char*> kSections[] = {
        {"P23", "Border"}, {"P15", "Shadow"}, {"P12", "Picture"}, {"P8", "Color key"}};
    for (const auto& [key, name] : kSections) {
        for (uint32_t i = 0; i <= param; ++i) {
            if (key == effect.params[i].key) {
                return name;
            }
        }
    }
    return {};
}

std::string WordsOfKey(std::string_view key) {
    key = WithoutLabels(key);
    DropPrefix(key, "IDS_");
    DropPrefix(key, "DSP_");
    if (!FamilyTag(key).empty()) {
        key.remove_prefix(3);
    }
    DropPrefix(key, "Param_");
    for (const std::string_view ending : {"_Name", "_Desc"}) {
        if (key.ends_with(ending)) {
            key.remove_suffix(ending.size());
        }
    }
    std::string words;
    for (size_t i = 0; i < key.size(); ++i) {
        if (key[i] == '_') {
            words += ' ';
            continue;
        }
        const bool inside = !words.empty() && words.back() != ' ';
        const bool newWord = inside && WordEndsBefore(key, i);
        words += newWord ? " " : "";
        // Capitals at the start and in "A", "X" or "3D" stay.
        const bool plainWord = i + 1 < key.size() && IsLower(key[i + 1]);
        words += !words.empty() && plainWord ? Lower(key.substr(i, 1)) : std::string(1, key[i]);
    }
    return words;
}

std::string LanguageText(const EffectDescriptor& effect, const char* key) {
    const KyvModuleHandle library = effect.module ? effect.module->ResourceLibrary : nullptr;
    if (!key) {
        return {};
    }
    auto find = library ? reinterpret_cast<KyvLanguageTextFunction>(
                              kyv::FindSymbol(library, KYV_LANGUAGE_TEXT_NAME))
                        : nullptr;
    find = find ? find : g_textsBeside.load();
    const char* const text = find ? find(key) : nullptr;
    return text ? text : "";
}

std::string ParamName(const EffectDescriptor& effect, const ParamDescriptor& param) {
    const std::string text =
        LanguageText(effect, std::string(WithoutLabels(param.nameKey)).c_str());
    return text.empty() ? WordsOfKey(param.nameKey) : text;
}

std::string EffectName(const EffectDescriptor& effect) {
    const std::string text = LanguageText(effect, effect.nameKey);
    return text.empty() ? NameOfKey(effect) : text;
}

std::string ShortName(const EffectDescriptor& effect) {
    std::string name = Lower(NameOfKey(effect));
    std::replace(name.begin(), name.end(), ' ', '-');
    return name;
}

std::vector<std::string> ChoiceLabels(const ParamDescriptor& param) {
    std::vector<std::string> labels = Split(param.nameKey, ';');
    labels.erase(labels.begin());
    return labels;
}

std::vector<std::string> ChoiceNames(const EffectDescriptor& effect, const ParamDescriptor& param) {
    std::vector<std::string> names = ChoiceLabels(param);
    for (std::string& name : names) {
        std::string key(WithoutLabels(param.nameKey));
        key += ';';
        key += name;
        std::string text = LanguageText(effect, key.c_str());
        name = text.empty() ? name : text;
    }
    return names;
}

std::string Normalized(std::string_view text) {
    std::string normal;
    for (const char c : Lower(text)) {
        if (IsLower(c) || IsDigit(c) || static_cast<unsigned char>(c) >= 0x80) {
            normal += c;
        }
    }
    for (size_t at = 0; (at = normal.find("colour", at)) != std::string::npos;) {
        normal.erase(at + 4, 1);
    }
    return normal;
}

const EffectDescriptor* EffectOf(const ModuleDescriptor& module, std::string_view identifier) {
    const EffectDescriptor* const end = module.effects + module.effectCount;
    const auto* const found =
        std::find_if(module.effects, end, [identifier](const EffectDescriptor& effect) {
            return effect.identifier == identifier;
        });
    return found == end ? nullptr : found;
}

const EffectDescriptor& FindEffect(const ModuleDescriptor& module, std::string_view text,
                                   const std::string& where) {
    if (IsWholeNumber(text)) {
        uint32_t index = 0;
        const char* const end = text.data() + text.size();
        const auto [stop, error] = std::from_chars(text.data(), end, index);
        if (error == std::errc() && stop == end && index < module.effectCount) {
            return module.effects[index];
        }
        throw CUsageError("no effect " + std::string(text) + "; the indices are 0 to " +
                          std::to_string(module.effectCount - 1));
    }
    std::vector<std::string> names, parts;
    const EffectDescriptor* found = nullptr;
    for (uint32_t i = 0; i < module.effectCount; ++i) {
        const EffectDescriptor& effect = module.effects[i];
        for (const std::string& name : {ShortName(effect), Lower(BareEffectName(effect)),
                                        std::string(effect.identifier), EffectName(effect)}) {
            if (Normalized(name) == Normalized(text)) {
                return effect;
            }
            names.push_back(name);
        }
        if (IsPart(text, ShortName(effect)) || IsPart(text, EffectName(effect))) {
            found = &effect;
            parts.push_back(ShortName(effect));
        }
    }
    if (found && parts.size() == 1) {
        return *found;
    }
    if (parts.size() > 1) {
        throw CUsageError("several effects are called " + Quoted(text) + ": " + Join(parts, ", "));
    }
    throw CUsageError("no effect " + Quoted(text) + WithNearest(Nearest(text, names), where));
}

uint32_t FindParam(const EffectDescriptor& effect, std::string_view text,
                   const std::string& where) {
    struct Candidates {
        uint32_t last = 0;
        std::vector<std::string> keys;
        void Add(uint32_t index, const char* key) {
            last = index;
            keys.emplace_back(key);
        }
    };
    Candidates whole, parts;
    std::vector<std::string> names;
    for (uint32_t i = 0; i < effect.paramCount; ++i) {
        const ParamDescriptor& param = effect.params[i];
        const std::string name = ParamName(effect, param), words = WordsOfKey(param.nameKey);
        if (Normalized(param.key) == Normalized(text)) {
            return i;
        }
        if (Normalized(name) == Normalized(text) || Normalized(words) == Normalized(text)) {
            whole.Add(i, param.key);
        } else if (IsPart(text, name) || IsPart(text, words)) {
            parts.Add(i, param.key);
        }
        names.emplace_back(param.key);
        names.push_back(Lower(name));
        names.push_back(Lower(words));
    }
    for (const Candidates& candidates : {whole, parts}) {
        if (candidates.keys.size() == 1) {
            return candidates.last;
        }
        if (candidates.keys.size() > 1) {
            throw CUsageError("several parameters of " + ShortName(effect) + " are called " +
                              Quoted(text) +
                              "; name one by its key: " + Join(candidates.keys, ", "));
        }
    }
    if (names.empty()) {
        throw CUsageError(ShortName(effect) + " has no parameters");
    }
    throw CUsageError(ShortName(effect) + " has no parameter " + Quoted(text) +
                      WithNearest(Nearest(text, names), where));
}

} // namespace kyvhosting
