// JSON whose parts know their lines, so that an error can name the place.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace kyvhost {

struct JsonNode {
    enum class Kind { Null, Switch, Number, Text, List, Object };

    Kind kind = Kind::Null;
    int line = 0;                   // from 1; of a member, that of its name
    std::string text;               // of a text, or as a person would write it: on, off, 0.25
    std::vector<JsonNode> items;    // of a list, or an object's values in the file's order
    std::vector<std::string> names; // of an object, one for each value

    // Null when there is none.
    const JsonNode* Find(std::string_view name) const;
};

// file names the text in errors. Throws CUsageError with the line for what is no JSON, for a name
// that an object has twice, and for what is nested deeper than any file of ours.
JsonNode ParseJson(std::string_view text, const std::string& file);

// "look.json, line 7: " and the message, as CUsageError.
[[noreturn]] void RefuseAt(const std::string& file, int line, const std::string& message);

} // namespace kyvhost
