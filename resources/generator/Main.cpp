// Draws every picture of the module into the folder given as the only argument.
#include <cstdio>
#include <exception>
#include <string>

#include "resources/generator/Art.h"

using namespace kyvart;

int main(int argc, char** argv) {
    if (argc != 2) {
        std::fprintf(stderr, "usage: kyv_art FOLDER\n");
        return 2;
    }
    const std::string folder = std::string(argv[1]) + "/";
    try {
        kyvdraw::WritePng(folder + "Png141.png", DrawBubbleBody());
        kyvdraw::WritePng(folder + "Png142.png", DrawMiniatureMask());
        kyvdraw::WritePng(folder + "Png143.png", DrawLensMask());
        kyvdraw::WritePng(folder + "Png145.png", DrawSheen());
        kyvdraw::WriteBmp32(folder + "Bitmap101.bmp", DrawSpark());
        kyvdraw::WriteBmp32(folder + "Bitmap135.bmp", DrawStar());
        kyvdraw::WriteBmp32(folder + "Bitmap126.bmp", DrawBubbleBody(2.4f));
        kyvdraw::WriteBmp32(folder + "Bitmap127.bmp", DrawLens());
        kyvdraw::WriteBmp32(folder + "Bitmap128.bmp", DrawDrop());
        kyvdraw::WriteBmp32(folder + "Bitmap129.bmp", DrawFlare());
        kyvdraw::WriteBmp32(folder + "Bitmap130.bmp", DrawRings());
        const WipeMask ink = DrawInkMask(), diamonds = DrawDiamondMask();
        kyvdraw::WriteBmp8(folder + "Bitmap140.bmp", kMaskWidth, kMaskHeight, ink.indices,
                           ink.greys);
        kyvdraw::WriteBmp8(folder + "Bitmap113.bmp", kMaskWidth, kMaskHeight, diamonds.indices,
                           diamonds.greys);
    } catch (const std::exception& error) {
        std::fprintf(stderr, "kyv_art: %s\n", error.what());
        return 1;
    }
}
