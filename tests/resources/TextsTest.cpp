// The built language libraries against the keys of the built module.
#include <algorithm>
#include <iterator>
#include <map>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "interface/LanguageLibrary.h"
#include "platform/Library.h"
#include "tests/support/TestHost.h"

namespace {

std::vector<std::string> Split(const std::string& text, char separator) {
    std::vector<std::string> parts;
    std::istringstream stream(text);
    for (std::string part; std::getline(stream, part, separator);) {
        parts.push_back(part);
    }
    return parts;
}

// A loaded language library.
struct Language {
    std::string file;
    kyv::LibraryHandle library = nullptr;
    KyvLanguageTextFunction text = nullptr;
    const LanguageDescriptor* all = nullptr;
};

// All that are built, loaded for good.
const std::vector<Language>& Languages() {
    static const std::vector<Language> languages = [] {
        std::vector<Language> loaded;
        for (const std::string& file : Split(KYV_LANGUAGE_FILES, '|')) {
            Language language{file, kyv::OpenLibrary(std::filesystem::path(file).native())};
            language.text = reinterpret_cast<KyvLanguageTextFunction>(
                kyv::FindSymbol(language.library, KYV_LANGUAGE_TEXT_NAME));
            const auto all = reinterpret_cast<KyvLanguageFunction>(
                kyv::FindSymbol(language.library, KYV_LANGUAGE_NAME));
            language.all = all ? all() : nullptr;
            if (language.text && language.all) {
                loaded.push_back(language);
            } else {
                ADD_FAILURE() << file << " is no language library";
            }
        }
        return loaded;
    }();
    return languages;
}

// The keys of a name: "KEY" of itself, "KEY;label" of each choice.
std::vector<std::string> KeysOfName(const char* nameKey) {
    std::vector<std::string> keys = Split(nameKey, ';');
    for (size_t i = 1; i < keys.size(); ++i) {
        keys[i] = keys[0] + ";" + keys[i];
    }
    return keys;
}

std::set<std::string> KeysOfModule() {
    std::set<std::string> keys;
    const auto add = [&](const char* key) {
        if (key && std::string(key) != "none") {
            for (std::string& one : KeysOfName(key)) {
                keys.insert(std::move(one));
            }
        }
    };
    const ModuleDescriptor& module = kyvtest::Module();
    add(module.nameKey);
    add(module.descKey);
    for (uint32_t i = 0; i < module.effectCount; ++i) {
        const EffectDescriptor& effect = module.effects[i];
        add(effect.nameKey);
        add(effect.descKey);
        add(effect.subclass);
        for (uint32_t j = 0; j < effect.paramCount; ++j) {
            add(effect.params[j].nameKey);
            add(effect.params[j].descKey);
        }
    }
    return keys;
}

std::vector<std::string> Without(const std::set<std::string>& all,
                                 const std::set<std::string>& taken) {
    std::vector<std::string> rest;
    std::ranges::set_difference(all, taken, std::back_inserter(rest));
    return rest;
}

// Printable UTF-8 in its shortest form.
bool IsPlainText(const std::string& text) {
    for (size_t i = 0; i < text.size();) {
        const auto lead = static_cast<unsigned char>(text[i]);
        const size_t size = lead < 0x80 ? 1 : lead < 0xE0 ? 2 : lead < 0xF0 ? 3 : 4;
        uint32_t code = size == 1 ? lead : lead & (0x7Fu >> size);
        if (i + size > text.size() || (lead >= 0x80 && lead < 0xC2) || lead > 0xF4) {
            return false;
        }
        for (size_t k = 1; k < size; ++k) {
            const auto next = static_cast<unsigned char>(text[i + k]);
            if ((next & 0xC0) != 0x80) {
                return false;
            }
            code = code << 6 | (next & 0x3Fu);
        }
        constexpr uint32_t kLeast[] = {0, 0x20, 0xA0, 0x800, 0x10000};
        if (code < kLeast[size] || code == 0x7F || code == 0xFFFD || code == 0xFEFF) {
            return false;
        }
        i += size;
    }
    return true;
}

TEST(Texts, EveryKeyHasOneAndNoneIsStray) {
    const std::set<std::string> wanted = KeysOfModule();
    ASSERT_GT(wanted.size(), 100U);
    ASSERT_GE(Languages().size(), 3U);
    for (const Language& language : Languages()) {
        SCOPED_TRACE(language.file);
        EXPECT_EQ(language.all->formatNumber, 1U);
        std::set<std::string> found;
        for (uint32_t i = 0; i < language.all->textCount; ++i) {
            found.insert(language.all->texts[i].key);
        }
        EXPECT_EQ(found.size(), language.all->textCount) << "a key is there twice";
        EXPECT_THAT(Without(wanted, found), testing::IsEmpty()) << "keys without a text";
        EXPECT_THAT(Without(found, wanted), testing::IsEmpty()) << "texts without a key";
    }
}

TEST(Texts, AreFoundByKeyAndFitToShow) {
    for (const Language& language : Languages()) {
        for (uint32_t i = 0; i < language.all->textCount; ++i) {
            const LanguageText& entry = language.all->texts[i];
            SCOPED_TRACE(language.file + ": " + entry.key);
            EXPECT_EQ(language.text(entry.key), entry.text);
            const std::string text = entry.text;
            EXPECT_TRUE(IsPlainText(text)) << text;
            EXPECT_TRUE(!text.empty() && text.front() != ' ' && text.back() != ' ');
            EXPECT_EQ(text.find("IDS_"), std::string::npos) << "a key in place of a text";
        }
        for (const char* key : {"", "none", "IDS_", "IDS_Vi_Param_MaskType_Name;box;circle",
                                "IDS_Vi_Param_MaskType_Name;", "ids_module_name"}) {
            EXPECT_EQ(language.text(key), nullptr) << key;
        }
        EXPECT_EQ(language.text(nullptr), nullptr);
    }
}

TEST(Texts, TellThingsApart) {
    const ModuleDescriptor& module = kyvtest::Module();
    for (const Language& language : Languages()) {
        SCOPED_TRACE(language.file);
        // Different keys side by side in one menu: different texts.
        const auto expectDistinct = [&](const std::set<std::string>& keys) {
            std::map<std::string, std::string> owners;
            for (const std::string& key : keys) {
                const char* text = language.text(key.c_str());
                ASSERT_NE(text, nullptr) << key;
                const auto [owner, isNew] = owners.emplace(text, key);
                EXPECT_TRUE(isNew) << key << " and " << owner->second << " are both " << text;
            }
        };
        std::set<std::string> effects, categories;
        for (uint32_t i = 0; i < module.effectCount; ++i) {
            const EffectDescriptor& effect = module.effects[i];
            effects.insert(effect.nameKey);
            categories.insert(effect.subclass);
            std::set<std::string> params;
            for (uint32_t j = 0; j < effect.paramCount; ++j) {
                std::vector<std::string> keys = KeysOfName(effect.params[j].nameKey);
                params.insert(keys.front());
                expectDistinct({keys.begin() + 1, keys.end()});
            }
            expectDistinct(params);
        }
        expectDistinct(effects);
        expectDistinct(categories);
    }
}

TEST(Texts, AreInTheLanguageThatTheySay) {
    std::map<std::string, const Language*> byTag;
    for (const Language& language : Languages()) {
        byTag[language.all->language] = &language;
    }
    const struct {
        const char *tag, *bubble, *white;
    } cases[] = {{"en-US", "Bubble", "White balance"},
                 {"de", "Seifenblasen", "Wei\u00DFabgleich"},
                 {"fr", "Bulles de savon", "Balance des blancs"}};
    ASSERT_EQ(byTag.size(), std::size(cases));
    for (const auto& c : cases) {
        SCOPED_TRACE(c.tag);
        ASSERT_TRUE(byTag.count(c.tag));
        const Language& language = *byTag[c.tag];
        EXPECT_STREQ(language.text("IDS_DSP_Vi_Bubble_Name"), c.bubble);
        EXPECT_STREQ(language.text("IDS_DSP_Co_WhiteBalance_Name"), c.white);
        // A few words are the same in two languages; whole tables are not.
        uint32_t same = 0;
        for (uint32_t i = 0; i < language.all->textCount; ++i) {
            const LanguageText& entry = language.all->texts[i];
            same += std::string(entry.text) == byTag["en-US"]->text(entry.key);
        }
        EXPECT_TRUE(language.all->language == std::string("en-US") || same < 10) << same;
    }
}

} // namespace
