// Numbers in the server's answers
#pragma once

#include <cstdint>
#include <limits>
#include <stdexcept>

#include <nlohmann/json.hpp>

namespace pelliko::service
{

/** A whole number from 0 on. Throws std::exception for anything else: fractions and numbers that
 * need more than 63 bits would be cut to some other number without a word. */
inline int64_t wholeNumber(const nlohmann::json &object, const char *member)
{
    const nlohmann::json &value = object.at(member);
    if (!value.is_number_unsigned() ||
        value.get<uint64_t>() > uint64_t{std::numeric_limits<int64_t>::max()}) {
        throw std::invalid_argument(member);
    }
    return value.get<int64_t>();
}

} // namespace pelliko::service
