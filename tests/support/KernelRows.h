// How tables of row loops become entries of the catalogue.
#pragma once

#include "imageutility/kernels/KernelTable.h"
#include "tests/support/KernelCatalog.h"

namespace kyvtest {

// Completes an entry whose table holds loops over blocks. bind(seed) makes the parameters and gives
// a callable block(form, buffers).
template <class Function, class Bind>
KernelEntry Blocks(const kyv::KernelTable<Function>& table, KernelEntry entry, Bind bind) {
    entry.hasForm = [&table](kyv::InstructionSet set) { return table.Exact(set) != nullptr; };
    entry.exact = [&table](kyv::InstructionSet set) {
        return reinterpret_cast<const void*>(table.Exact(set));
    };
    entry.selected = [&table](kyv::InstructionSet set) {
        return reinterpret_cast<const void*>(table.For(set));
    };
    entry.prepare = [&table, bind](uint32_t seed) -> KernelRun {
        return [&table, block = bind(seed)](kyv::InstructionSet set, const KernelBuffers& buffers) {
            block(table.Exact(set), buffers);
        };
    };
    return entry;
}

inline constexpr size_t kMostSources = 10; // of a row loop

// The same for row loops: bind(seed) gives a callable row(form, dst, sources, count), where sources
// are the rows' first bytes.
template <class Function, class Bind>
KernelEntry Rows(const kyv::KernelTable<Function>& table, KernelEntry entry, Bind bind) {
    return Blocks(table, std::move(entry), [bind](uint32_t seed) {
        return [row = bind(seed)](Function form, const KernelBuffers& buffers) {
            const uint8_t* sources[kMostSources] = {};
            for (int32_t y = 0; y < buffers.size.height; ++y) {
                for (size_t i = 0; i < buffers.sources.size(); ++i) {
                    sources[i] = buffers.sources[i].pixels + y * buffers.sources[i].pitch;
                }
                row(form, buffers.dst + y * buffers.dstPitch, sources,
                    static_cast<size_t>(buffers.size.width));
            }
        };
    });
}

// For row(dst, src, count).
inline constexpr auto kUnary = [](uint32_t) {
    return [](auto form, uint8_t* dst, const uint8_t* const* src, size_t count) {
        form(dst, src[0], count);
    };
};

// For row(pixels, count).
inline constexpr auto kInPlaceOnly = [](uint32_t) {
    return [](auto form, uint8_t* pixels, const uint8_t* const*, size_t count) {
        form(pixels, count);
    };
};

// The parts of the list that live in files of their own.
void AddImageOperations(std::vector<KernelEntry>& list);
void AddParticles(std::vector<KernelEntry>& list);
void AddStyle(std::vector<KernelEntry>& list);
void AddPip(std::vector<KernelEntry>& list);
void AddTransitions(std::vector<KernelEntry>& list);

} // namespace kyvtest
