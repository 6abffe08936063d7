// What kyvhost calls things, with and without a language library beside the module.
#include <gmock/gmock.h>
#include <nlohmann/json.hpp>

#include "module/ResourceLibrary.h"
#include "platform/Library.h"
#include "tests/host/HostRun.h"
#include "tests/support/TestHost.h"

namespace {

namespace fs = std::filesystem;
using json = nlohmann::json;
using kyvtest::HostResult;
using testing::HasSubstr;

// A copy of the module in the test's own folder, away from the libraries beside the built one.
class NamesTest : public kyvtest::HostTest {
protected:
    NamesTest() : m_module(Path("plug.bin")) { fs::copy_file(kyvtest::ModuleFile(), m_module); }

    // Puts the German texts where the module looks for those of whoever runs the test.
    void SpeakGerman() {
        fs::copy_file(KYV_GERMAN_FILE, kyv::LanguageLibraryPath(fs::path(m_module).native(),
                                                                kyv::AbbreviatedLanguageName()));
    }

    HostResult Run(std::vector<std::string> arguments) const {
        return kyvtest::RunHostWith(m_module, std::move(arguments));
    }

    json Json(const std::string& verb, const std::string& effect = "") const {
        std::vector<std::string> arguments = {verb, "--json"};
        if (!effect.empty()) {
            arguments.insert(arguments.begin() + 1, effect);
        }
        const HostResult result = Run(arguments);
        EXPECT_EQ(result.status, 0) << result.error;
        return json::parse(result.output, nullptr, false);
    }

    std::string m_module;
};

TEST_F(NamesTest, ComeFromTheKeysWithoutALibrary) {
    EXPECT_EQ(Json("list")["effects"][9]["name"], "Pencil sketch");
    const json effect = Json("info", "9");
    EXPECT_EQ(effect["category"], "DSP_SUBCLASS_V_EF_STYLE");
    EXPECT_EQ(effect["description"], "");
    EXPECT_EQ(effect["parameters"][2]["name"], "Edge inten");
    EXPECT_EQ(effect["parameters"][4]["choiceNames"], json({"box", "circle"}));
    EXPECT_THAT(Run({"info", "pencil"}).output, HasSubstr("one of box, circle\n"));
}

TEST_F(NamesTest, ComeFromTheLibraryWhenThereIsOne) {
    SpeakGerman();
    EXPECT_EQ(Json("list")["effects"][9]["name"], "Bleistiftzeichnung");
    const json effect = Json("info", "9");
    EXPECT_EQ(effect["shortName"], "pencil-sketch");
    EXPECT_EQ(effect["category"], "Stil");
    EXPECT_EQ(effect["description"], "Zeichnet das Bild wie mit Bleistift auf Papier");
    EXPECT_EQ(effect["parameters"][1]["name"], "Kantenschwelle");
    EXPECT_EQ(effect["parameters"][4]["choices"], json({"box", "circle"}));
    EXPECT_EQ(effect["parameters"][4]["choiceNames"], json({"Rechteck", "Kreis"}));
    EXPECT_THAT(Run({"info", "pencil"}).output, HasSubstr("box (Rechteck), circle (Kreis)\n"));
    // One text is both name and description here, and "none" is no key: neither is a sentence.
    EXPECT_EQ(Json("info", "alpha-transition")["description"], "");
    EXPECT_EQ(Json("info", "white-balance")["description"], "");
}

TEST_F(NamesTest, ServeTheCommandLineInBothLanguages) {
    SpeakGerman();
    Write("in.png", 1, {0xFF646464});
    // 100 becomes 59, 118 and 192 for the reference #FF8000 (RenderTest has the sums).
    for (const char* effect : {"white-balance", "white", "Wei\u00DFabgleich", "abgleich"}) {
        for (const char* param : {"reference point=", "Referenzfarbe=", "referenz="}) {
            const HostResult result = Run({"render", effect, "-y", Path("in.png"), Path("out.png"),
                                           "--set", std::string(param) + "#FF8000"});
            EXPECT_EQ(result.status, 0) << effect << ' ' << param << result.error;
            EXPECT_THAT(Read("out.png"), testing::ElementsAre(0xFF3B76C0))
                << effect << ' ' << param;
            fs::remove(Path("out.png"));
        }
    }
    EXPECT_THAT(Run({"info", "Bleistiftzeichnumg"}).error, HasSubstr("leistiftzeichnung\""));
    EXPECT_THAT(Run({"info", "blasen"}).error, HasSubstr("refractive-bubble, bubble"));
}

TEST_F(NamesTest, LineUpInColumnsWhateverTheirLetters) {
    SpeakGerman();
    const std::string table = Run({"list"}).output;
    const json effects = Json("list")["effects"];
    std::vector<size_t> columns;
    for (const json& effect : effects) {
        const size_t at = table.find(effect["identifier"].get<std::string>());
        ASSERT_NE(at, std::string::npos);
        const size_t line = table.rfind('\n', at) + 1;
        columns.push_back(0);
        for (size_t i = line; i < at; ++i) {
            columns.back() += (table[i] & 0xC0) != 0x80;
        }
    }
    EXPECT_THAT(columns, testing::Each(columns.front())) << table;
}

} // namespace
