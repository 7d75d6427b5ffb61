#pragma once

#include <concepts>
#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <iosfwd>
#include <memory>
#include <nlohmann/json_fwd.hpp>
#include <string>
#include <string_view>
#include <vector>

namespace pelliko::test
{

/// Something that a program wrote as JSON, to be read and compared. It stands before the JSON
/// library, whose header costs each file that includes it several seconds. Values never change and
/// are cheap to copy.
class JsonValue
{
public:
    JsonValue(std::nullptr_t);
    JsonValue(bool value);
    JsonValue(double value);
    template <std::integral Number>
    JsonValue(Number value) : JsonValue(Whole{static_cast<int64_t>(value)})
    {
    }
    JsonValue(const char *text);
    JsonValue(const std::string &text);

    /// Throws std::invalid_argument with the text where it is not JSON: the test fails and shows
    /// it.
    static JsonValue parse(std::string_view text);
    /// One value for each line of a file; none where there is no file.
    static std::vector<JsonValue> linesOf(const std::filesystem::path &file);

    /// A member, null where there is none.
    JsonValue operator[](const char *name) const;
    /// Throws std::out_of_range beyond the end.
    JsonValue operator[](size_t index) const;
    JsonValue operator[](int index) const { return (*this)[static_cast<size_t>(index)]; }
    bool contains(const char *name) const;
    /// Of an array or an object; 0 for null, 1 for anything else.
    size_t size() const;

    /// The text of a text. The two throw std::invalid_argument for a value of another kind.
    std::string text() const;
    int64_t number() const;

    bool operator==(const JsonValue &other) const;
    friend std::ostream &operator<<(std::ostream &out, const JsonValue &value);

private:
    struct Whole {
        int64_t value;
    };
    explicit JsonValue(Whole number);
    explicit JsonValue(nlohmann::json value);
    explicit JsonValue(std::shared_ptr<const nlohmann::json> value) : value_(std::move(value)) {}

    std::shared_ptr<const nlohmann::json> value_;
};

} // namespace pelliko::test
