// The descriptor records as a host reads them: raw bytes at fixed offsets, without our header.
#include <cinttypes>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iterator>
#include <set>
#include <sstream>
#include <string>

#include <gtest/gtest.h>

#include "tests/support/TestHost.h"

namespace {

using Bytes = const uint8_t*;

template <class T>
T At(Bytes record, size_t offset) {
    T value;
    std::memcpy(&value, record + offset, sizeof value);
    return value;
}

std::string TextAt(Bytes record, size_t offset) {
    const auto* text = At<const char*>(record, offset);
    return text ? text : "null";
}

Bytes ModuleBytes() {
    return reinterpret_cast<Bytes>(&kyvtest::Module());
}
Bytes EffectBytes(uint32_t i) {
    return At<Bytes>(ModuleBytes(), 0x40) + size_t{216} * i;
}
Bytes ParamBytes(Bytes effect, uint32_t i) {
    return At<Bytes>(effect, 0x70) + size_t{120} * i;
}

std::string Hex(Bytes bytes, uint32_t size) {
    std::string text;
    for (uint32_t i = 0; i < size; ++i) {
        char digits[3];
        std::snprintf(digits, sizeof digits, "%02x", bytes[i]);
        text += digits;
    }
    return text;
}

// One line an effect, followed by one line a parameter with the bytes of its six values.
std::string Listing() {
    std::ostringstream out;
    for (uint32_t i = 0; i < At<uint32_t>(ModuleBytes(), 0x38); ++i) {
        const Bytes effect = EffectBytes(i);
        for (const size_t offset : {0x00, 0x08, 0x10, 0x18, 0x20, 0xd0}) {
            out << TextAt(effect, offset) << ' ';
        }
        out << At<uint32_t>(effect, 0x80) << ' ' << At<uint32_t>(effect, 0x6c);
        for (size_t offset = 0x28; offset <= 0x68; offset += 4) {
            out << ' ' << At<uint32_t>(effect, offset);
        }
        out << '\n';
        for (uint32_t j = 0; j < At<uint32_t>(effect, 0x6c); ++j) {
            const Bytes param = ParamBytes(effect, j);
            out << TextAt(param, 0x00) << ' ' << TextAt(param, 0x08) << ' ' << TextAt(param, 0x10);
            for (const size_t offset : {0x54, 0x58, 0x5c, 0x60, 0x70}) {
                out << ' ' << At<uint32_t>(param, offset);
            }
            for (size_t offset = 0x18; offset <= 0x40; offset += 8) {
                out << ' ' << Hex(At<Bytes>(param, offset), At<uint32_t>(param, 0x5c));
            }
            out << '\n';
        }
    }
    return out.str();
}

// After a change that is meant, or with a new effect, the list is written anew with KYV_WRITE=1 in
// the environment.
TEST(Records, EveryFieldIsWhatHostsMatchOn) {
    if (std::getenv("KYV_WRITE")) {
        std::ofstream(KYV_RECORDS_FILE) << Listing();
    }
    std::ifstream file(KYV_RECORDS_FILE);
    const std::string expected((std::istreambuf_iterator<char>(file)),
                               std::istreambuf_iterator<char>());
    ASSERT_FALSE(expected.empty()) << KYV_RECORDS_FILE;
    EXPECT_EQ(Listing(), expected);
}

TEST(Records, ModuleDescribesItself) {
    EXPECT_EQ(At<uint32_t>(ModuleBytes(), 0x00), 11U);
    EXPECT_EQ(TextAt(ModuleBytes(), 0x08), "IDS_Module_Name");
    EXPECT_EQ(TextAt(ModuleBytes(), 0x10), "IDS_Module_Desc");
    EXPECT_EQ(TextAt(ModuleBytes(), 0x18), "Module Author");
    EXPECT_EQ(TextAt(ModuleBytes(), 0x20), "Module Vendor");
    EXPECT_NE(At<void*>(ModuleBytes(), 0x28), nullptr);
    EXPECT_NE(At<void*>(ModuleBytes(), 0x30), nullptr);
}

TEST(Records, UnusedFieldsAreZeroAndPointersLeadWhereTheyShould) {
    std::set<const void*> values;
    for (uint32_t i = 0; i < At<uint32_t>(ModuleBytes(), 0x38); ++i) {
        const Bytes effect = EffectBytes(i);
        EXPECT_EQ(At<Bytes>(effect, 0x78), ModuleBytes());
        for (const size_t slot : {0x88, 0x90, 0x98, 0xa0, 0xb0, 0xb8}) {
            EXPECT_NE(At<void*>(effect, slot), nullptr) << i << " slot " << slot;
        }
        EXPECT_EQ(At<void*>(effect, 0x90), At<void*>(effect, 0xb8)) << "one release routine";
        for (const size_t slot : {0xa8, 0xc0, 0xc8}) {
            EXPECT_EQ(At<void*>(effect, slot), nullptr) << i << " slot " << slot;
        }
        for (uint32_t j = 0; j < At<uint32_t>(effect, 0x6c); ++j) {
            const Bytes param = ParamBytes(effect, j);
            EXPECT_EQ(At<uint64_t>(param, 0x48), 0U);
            EXPECT_EQ(At<uint32_t>(param, 0x50), 0U);
            EXPECT_EQ(At<uint32_t>(param, 0x64), 0U);
            EXPECT_EQ(At<uint64_t>(param, 0x68), 0U);
            EXPECT_EQ(At<uint32_t>(param, 0x74), 0U);
            for (size_t offset = 0x18; offset <= 0x40; offset += 8) {
                EXPECT_TRUE(values.insert(At<void*>(param, offset)).second)
                    << "effect " << i << " parameter " << j << " shares a value";
            }
        }
    }
}

} // namespace
