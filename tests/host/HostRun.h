// Runs the built kyvhost as a user does and keeps what it says.
#pragma once

#include <filesystem>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "host/Picture.h"

namespace kyvtest {

struct HostResult {
    int status = -1;
    std::string output, error;
};

// Runs a program with arguments and collects what it writes.
HostResult RunProgram(const std::string& program, const std::vector<std::string>& arguments);

// kyvhost with the module that the build made, or with another one. Lines end with '\n' alone.
HostResult RunHost(const std::vector<std::string>& arguments);
HostResult RunHostWith(const std::string& module, std::vector<std::string> arguments);

std::string HostFile();
std::string ProbeModule();
std::string OldModule();   // the probe with another format number
std::string EmptyModule(); // exports nothing

// A test with a folder of its own, removed at its end.
class HostTest : public testing::Test {
protected:
    HostTest();
    ~HostTest() override;

    std::string Path(const std::string& name) const;

    // Names of all files in the folder, sorted.
    std::vector<std::string> Files() const;

    // A picture of the given pixels, 0xAARRGGBB, in rows of width.
    std::string Write(const std::string& name, uint32_t width,
                      const std::vector<uint32_t>& pixels) const;

    // Pixels of a picture; empty when it cannot be read.
    std::vector<uint32_t> Read(const std::string& name) const;

private:
    std::filesystem::path m_folder;
};

// A picture whose pixels all differ, opaque.
std::vector<uint32_t> Ramp(uint32_t width, uint32_t height);

} // namespace kyvtest
