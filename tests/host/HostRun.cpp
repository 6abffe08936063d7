// Running kyvhost.
#include "tests/host/HostRun.h"

#include <algorithm>
#include <cstring>
#include <random>
#include <thread>

#include "platform/Process.h"

namespace kyvtest {
namespace {

namespace fs = std::filesystem;

void DropCarriageReturns(std::string& text) {
    text.erase(std::remove(text.begin(), text.end(), '\r'), text.end());
}

} // namespace

HostResult RunProgram(const std::string& program, const std::vector<std::string>& arguments) {
    using kyv::ChildStream;
    kyv::CProcess process(program, arguments, ChildStream::Null, ChildStream::Pipe,
                          ChildStream::Pipe);
    HostResult result;
    std::thread errors([&] {
        char buffer[4096];
        while (const size_t count = process.ReadError(buffer, sizeof buffer)) {
            result.error.append(buffer, count);
        }
    });
    char buffer[4096];
    while (const size_t count = process.ReadOutput(buffer, sizeof buffer)) {
        result.output.append(buffer, count);
    }
    errors.join();
    result.status = process.Wait();
    return result;
}

HostResult RunHost(const std::vector<std::string>& arguments) {
    HostResult result = RunProgram(HostFile(), arguments);
    DropCarriageReturns(result.output);
    DropCarriageReturns(result.error);
    return result;
}

HostResult RunHostWith(const std::string& module, std::vector<std::string> arguments) {
    arguments.insert(arguments.end(), {"--module", module});
    return RunHost(arguments);
}

std::string HostFile() {
    return KYV_HOST_FILE;
}

std::string ProbeModule() {
    return KYV_PROBE_FILE;
}
std::string OldModule() {
    return KYV_OLD_FILE;
}
std::string EmptyModule() {
    return KYV_EMPTY_FILE;
}

HostTest::HostTest()
    : m_folder(fs::temp_directory_path() /
               ("kyvhost-test-" + std::to_string(std::random_device()()))) {
    fs::create_directories(m_folder);
}

HostTest::~HostTest() {
    std::error_code error;
    fs::remove_all(m_folder, error);
}

std::string HostTest::Path(const std::string& name) const {
    return (m_folder / name).string();
}

std::vector<std::string> HostTest::Files() const {
    std::vector<std::string> names;
    for (const fs::directory_entry& entry : fs::directory_iterator(m_folder)) {
        names.push_back(entry.path().filename().string());
    }
    std::sort(names.begin(), names.end());
    return names;
}

std::string HostTest::Write(const std::string& name, uint32_t width,
                            const std::vector<uint32_t>& pixels) const {
    kyvhost::Picture picture;
    picture.width = width;
    picture.height = static_cast<uint32_t>(pixels.size()) / width;
    picture.pixels.resize(pixels.size() * 4);
    std::memcpy(picture.pixels.data(), pixels.data(), picture.pixels.size());
    kyvhost::WritePicture(picture, Path(name), name);
    return Path(name);
}

std::vector<uint32_t> HostTest::Read(const std::string& name) const {
    try {
        const kyvhost::Picture picture = kyvhost::ReadPicture(Path(name));
        std::vector<uint32_t> pixels(picture.pixels.size() / 4);
        std::memcpy(pixels.data(), picture.pixels.data(), picture.pixels.size());
        return pixels;
    } catch (const std::exception& error) {
        ADD_FAILURE() << error.what();
        return {};
    }
}

std::vector<uint32_t> Ramp(uint32_t width, uint32_t height) {
    std::vector<uint32_t> pixels;
    for (uint32_t y = 0; y < height; ++y) {
        for (uint32_t x = 0; x < width; ++x) {
            pixels.push_back(0xFF000000 | (x * 5 % 256) << 16 | (y * 7 % 256) << 8 | (x ^ y) % 256);
        }
    }
    return pixels;
}

} // namespace kyvtest
