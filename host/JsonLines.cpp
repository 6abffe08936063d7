// JSON with lines, by way of the library's events.
#include "host/JsonLines.h"

#include <algorithm>
#include <iterator>

#include <nlohmann/json.hpp>

#include "host/ExitStatus.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

using nlohmann::json;

constexpr size_t kDeepest = 16;

// The line of the last character that was read and is no blank: the library looks one character
// past a number, and that may be the line's end.
struct Place {
    int line = 1, lastLine = 1;
};

class CCountingIterator {
public:
    using iterator_category = std::input_iterator_tag;
    using value_type = char;
    using difference_type = std::ptrdiff_t;
    using pointer = const char*;
    using reference = const char&;

    CCountingIterator(const char* at, Place* place) : m_pAt(at), m_pPlace(place) {}

    reference operator*() const { return *m_pAt; }
    CCountingIterator& operator++() {
        if (*m_pAt == '\n') {
            ++m_pPlace->line;
        } else if (*m_pAt != ' ' && *m_pAt != '\t' && *m_pAt != '\r') {
            m_pPlace->lastLine = m_pPlace->line;
        }
        ++m_pAt;
        return *this;
    }
    CCountingIterator operator++(int) {
        CCountingIterator old = *this;
        ++*this;
        return old;
    }
    bool operator==(const CCountingIterator& other) const { return m_pAt == other.m_pAt; }
    bool operator!=(const CCountingIterator& other) const { return m_pAt != other.m_pAt; }

private:
    const char* m_pAt;
    Place* m_pPlace;
};

using Kind = JsonNode::Kind;

// Builds the tree from the library's events.
class CTree {
public:
    CTree(const std::string& file, const Place& place) : m_file(file), m_place(place) {}

    bool null() { return Add(Kind::Null, "null"); }
    bool boolean(bool state) { return Add(Kind::Switch, state ? "on" : "off"); }
    bool number_integer(json::number_integer_t number) {
        return Add(Kind::Number, std::to_string(number));
    }
    bool number_unsigned(json::number_unsigned_t number) {
        return Add(Kind::Number, std::to_string(number));
    }
    bool number_float(json::number_float_t, const std::string& digits) {
        return Add(Kind::Number, digits);
    }
    bool string(std::string& text) { return Add(Kind::Text, text); }
    bool binary(json::binary_t&) { return false; } // of other forms of JSON

    bool start_object(size_t) { return Open(Kind::Object); }
    bool start_array(size_t) { return Open(Kind::List); }
    bool end_object() { return Close(); }
    bool end_array() { return Close(); }

    bool key(std::string& name) {
        if (m_open.back()->Find(name)) {
            RefuseAt(m_file, m_place.lastLine, Quoted(name) + " is there twice");
        }
        m_open.back()->names.push_back(name);
        m_nKeyLine = m_place.lastLine;
        return true;
    }

    bool parse_error(size_t, const std::string&, const json::exception& error) {
        std::string why = error.what(); // "[...] parse error at line 2, column 5: ..."
        const size_t colon = why.find(": ");
        why = colon == std::string::npos ? why : why.substr(colon + 2);
        RefuseAt(m_file, m_place.lastLine, why);
    }

    JsonNode Take() { return std::move(m_root); }

private:
    bool Add(Kind kind, const std::string& text) {
        JsonNode* node = &m_root;
        int line = m_place.lastLine;
        if (!m_open.empty()) {
            node = &m_open.back()->items.emplace_back();
            line = m_open.back()->kind == Kind::Object ? m_nKeyLine : line;
        }
        node->kind = kind;
        node->line = line;
        node->text = text;
        m_pLast = node;
        return true;
    }

    bool Open(Kind kind) {
        if (m_open.size() == kDeepest) {
            RefuseAt(m_file, m_place.lastLine, "this is nested too deep");
        }
        Add(kind, "");
        m_open.push_back(m_pLast); // what lies around it does not grow until it is closed
        return true;
    }

    bool Close() {
        m_open.pop_back();
        return true;
    }

    const std::string& m_file;
    const Place& m_place;
    JsonNode m_root;
    std::vector<JsonNode*> m_open;
    JsonNode* m_pLast = nullptr;
    int m_nKeyLine = 0;
};

} // namespace

const JsonNode* JsonNode::Find(std::string_view name) const {
    const auto found = std::find(names.begin(), names.end(), name);
    return found == names.end() ? nullptr : &items[static_cast<size_t>(found - names.begin())];
}

JsonNode ParseJson(std::string_view text, const std::string& file) {
    Place place;
    CTree tree(file, place);
    json::sax_parse(CCountingIterator(text.data(), &place),
                    CCountingIterator(text.data() + text.size(), &place), &tree);
    return tree.Take();
}

void RefuseAt(const std::string& file, int line, const std::string& message) {
    throw CUsageError(file + ", line " + std::to_string(line) + ": " + message);
}

} // namespace kyvhost
