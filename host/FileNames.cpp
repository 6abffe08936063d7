// Names that stand for something else than a plain file.
#include "host/FileNames.h"

#include <algorithm>
#include <string>

#include "host/Hosting.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

namespace fs = std::filesystem;

// The place and length of "%04d" in a name; length 0 when there is none.
struct Place {
    size_t at = 0, length = 0, digits = 0;
};

Place FindNumber(const std::string& name) {
    for (size_t at = name.find('%'); at != std::string::npos; at = name.find('%', at + 1)) {
        const size_t end = name.find_first_not_of("0123456789", at + 1);
        if (end != std::string::npos && name[end] == 'd' && end - at <= 3) {
            const std::string width = name.substr(at + 1, end - at - 1);
            return {at, end + 1 - at, width.empty() ? 0 : std::stoul(width)};
        }
    }
    return {};
}

} // namespace

bool IsDash(const fs::path& file) {
    return file == "-";
}

bool IsPipe(const fs::path& file) {
    std::error_code error;
    const fs::file_type type = fs::status(file, error).type();
    return IsDash(file) || type == fs::file_type::fifo || type == fs::file_type::character;
}

bool IsSequenceName(const fs::path& file) {
    return FindNumber(TextOf(file.filename())).length > 0;
}

fs::path SequenceFile(const fs::path& pattern, long number) {
    std::string name = TextOf(pattern.filename()), digits = std::to_string(number);
    const Place place = FindNumber(name);
    digits.insert(0, place.digits > digits.size() ? place.digits - digits.size() : 0, '0');
    return pattern.parent_path() / PathOf(name.replace(place.at, place.length, digits));
}

} // namespace kyvhost
