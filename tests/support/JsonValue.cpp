#include "JsonValue.h"

#include <fstream>
#include <nlohmann/json.hpp>
#include <ostream>
#include <stdexcept>

namespace pelliko::test
{

using nlohmann::json;

JsonValue::JsonValue(json value) : value_(std::make_shared<const json>(std::move(value))) {}
JsonValue::JsonValue(std::nullptr_t) : JsonValue(json()) {}
JsonValue::JsonValue(bool value) : JsonValue(json(value)) {}
JsonValue::JsonValue(double value) : JsonValue(json(value)) {}
JsonValue::JsonValue(Whole number) : JsonValue(json(number.value)) {}
JsonValue::JsonValue(const char *text) : JsonValue(json(text)) {}
JsonValue::JsonValue(const std::string &text) : JsonValue(json(text)) {}

JsonValue JsonValue::parse(std::string_view text)
{
    json value = json::parse(text, nullptr, false);
    if (value.is_discarded())
        throw std::invalid_argument("not JSON: " + std::string(text));
    return JsonValue(std::move(value));
}

std::vector<JsonValue> JsonValue::linesOf(const std::filesystem::path &file)
{
    std::vector<JsonValue> all;
    std::ifstream in(file);
    for (std::string line; std::getline(in, line);)
        all.push_back(parse(line));
    return all;
}

// A part keeps the whole alive.

JsonValue JsonValue::operator[](const char *name) const
{
    if (!contains(name))
        return nullptr;
    return JsonValue(std::shared_ptr<const json>(value_, &value_->at(name)));
}

JsonValue JsonValue::operator[](size_t index) const
{
    if (!value_->is_array() || index >= value_->size())
        throw std::out_of_range("no element " + std::to_string(index) + " in " + value_->dump());
    return JsonValue(std::shared_ptr<const json>(value_, &value_->at(index)));
}

bool JsonValue::contains(const char *name) const
{
    return value_->is_object() && value_->contains(name);
}

size_t JsonValue::size() const
{
    return value_->size();
}

std::string JsonValue::text() const
{
    if (!value_->is_string())
        throw std::invalid_argument("no text: " + value_->dump());
    return value_->get<std::string>();
}

int64_t JsonValue::number() const
{
    if (!value_->is_number_integer())
        throw std::invalid_argument("no whole number: " + value_->dump());
    return value_->get<int64_t>();
}

bool JsonValue::operator==(const JsonValue &other) const
{
    return *value_ == *other.value_;
}

std::ostream &operator<<(std::ostream &out, const JsonValue &value)
{
    return out << value.value_->dump();
}

} // namespace pelliko::test
