// The objects of --json: one per line, written as they come. Keys are the library's member names. What the text dump
// shows in hexadecimal is a "0x" text, every other number is a number.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <type_traits>
#include <vector>

#include "frame/LineBuffer.h"

namespace epinspect {

/// Writes objects about one file. Each kind of value has a name of its own, so that none is taken for another.
class Json {
public:
    /// Every object gets `file`, which is empty where the objects are not about a file, and the ids of the LUNs whose
    /// map it is, as far as they are known: "lid" the first, and "lids" all where there are several.
    explicit Json(const std::string& file, const std::vector<std::uint32_t>& lids = {});

    /// Starts an object: "kind", a literal, and "file".
    Json& begin(const char* kind);

    /// Ends the object and prints its line. Throws OutputFailure.
    void end();

    template <std::size_t keySize, typename Number>
    Json& number(const char (&name)[keySize], Number value) {
        static_assert(std::is_integral_v<Number> && !std::is_same_v<Number, bool>);
        key(name);
        auto magnitude = static_cast<std::uint64_t>(value);
        if constexpr (std::is_signed_v<Number>) {
            if (value < 0) {
                line_.add("-");
                magnitude = 0 - magnitude;
            }
        }
        line_.decimal(magnitude);
        return *this;
    }

    /// The same under a name that is known at run time only.
    Json& number(std::string_view name, std::uint64_t value);
    Json& hexadecimal(std::string_view name, std::uint64_t value);
    Json& null(std::string_view name);

    template <std::size_t keySize>
    Json& hexadecimal(const char (&name)[keySize], std::uint64_t value) {
        key(name);
        line_.add("\"").hexadecimal(value).add("\"");
        return *this;
    }

    template <std::size_t keySize>
    Json& boolean(const char (&name)[keySize], bool value) {
        key(name);
        line_.add(value ? "true" : "false");
        return *this;
    }

    template <std::size_t keySize>
    Json& null(const char (&name)[keySize]) {
        key(name);
        line_.add("null");
        return *this;
    }

    /// Bytes that are not UTF-8 become U+FFFD; all else is plain ASCII.
    Json& text(std::string_view name, std::string_view value);

    /// The same of a path; where it is not UTF-8, "NAMEHex" holds its bytes.
    Json& path(const std::string& name, const std::string& value);

    /// "lid" the first, "lids" all where they are several; nothing where there is none.
    Json& lids(const std::vector<std::uint32_t>& lids);

    Json& texts(std::string_view name, const std::vector<std::string>& values);

    /// Members that are JSON already: "name":value, and so on.
    Json& ready(std::string_view members);

    /// Objects and lists inside the object; elements of a list are objects without a name.
    Json& beginObject(std::string_view name = {});
    Json& endObject();
    Json& beginList(std::string_view name);
    Json& endList();

private:
    template <std::size_t keySize>
    void key(const char (&name)[keySize]) {
        line_.add(inner_ ? ",\"" : "\"", std::string_view(name, keySize - 1), "\":");
        inner_ = true;
    }

    void anyKey(std::string_view name);

    std::string file_;            ///< the members that tell the file, ready to be written
    const char* kind_ = nullptr;  ///< of the object before
    std::string begin_;           ///< how it began
    LineBuffer line_;
    bool inner_ = false;  ///< a comma must come before the next member
};

}  // namespace epinspect
