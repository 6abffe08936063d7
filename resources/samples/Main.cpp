// Draws the sample pictures into a folder; see the usage below.
#include <cstdio>
#include <exception>
#include <functional>
#include <string>

#include "resources/drawing/PictureFile.h"
#include "resources/samples/Samples.h"

using namespace kyvsamples;

int main(int argc, char** argv) {
    if (argc != 3 && argc != 4) {
        std::fprintf(stderr, "usage: kyv_samples FOLDER FONTFOLDER [PICTURE]\n");
        return 2;
    }
    const std::string folder = argv[1], fonts = argv[2], only = argc == 4 ? argv[3] : "";
    const std::pair<std::string, std::function<kyvdraw::CCanvas()>> pictures[] = {
        {"landscape", DrawLandscape}, {"night", DrawNight},
        {"portrait", DrawPortrait},   {"print", [&] { return DrawPrint(fonts); }},
        {"sunset", DrawSunset},
    };
    try {
        bool drawn = false;
        for (const auto& [name, draw] : pictures) {
            if (only.empty() || only == name) {
                kyvdraw::WritePng(folder + "/" + name + ".png", draw());
                drawn = true;
            }
        }
        if (!drawn) {
            std::fprintf(stderr, "kyv_samples: no picture %s\n", only.c_str());
            return 2;
        }
    } catch (const std::exception& error) {
        std::fprintf(stderr, "kyv_samples: %s\n", error.what());
        return 1;
    }
}
