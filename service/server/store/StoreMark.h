#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace pelliko::server
{

/// What a store is in a move of data from one to another. It stays with the store, so that whoever
/// comes next knows, whatever became of the program that moved.
struct StoreMark {
    enum class State {
        /// Data are copied from here; this is still the place where they are served.
        leaving,
        /// They have gone: what stands here is old.
        left,
        /// Not everything has come yet.
        arriving,
        /// Everything is here, but the place that it came from may not know yet.
        arrived,
        /// This is where they were moved to.
        here,
    };

    /// Of this move; both stores have the same.
    std::string id;
    State state = State::leaving;

    bool operator==(const StoreMark &) const = default;
};

/// "ID STATE".
[[nodiscard]] std::string textOf(const StoreMark &mark);
/// Nothing for what is no such text.
[[nodiscard]] std::optional<StoreMark> markOf(std::string_view text);

/// Throws std::runtime_error with a sentence when a store with this mark is not to be served.
/// `what` is "metadata" or "blobs".
void refuseUnserved(const std::optional<StoreMark> &mark, const char *what);

} // namespace pelliko::server
