#pragma once

#include <stdexcept>
#include <string>

namespace pelliko::server
{

/// A store did not do what it was asked. Something absent is no failure: it is a result.
class StorageFailure : public std::runtime_error
{
public:
    enum class Kind {
        broken,
        full,
        /// Not to be reached, or too busy: the same call may succeed a little later.
        unavailable,
        /// Bytes of an unfinished blob that it had taken are not there any more.
        lost
    };

    StorageFailure(Kind kind, const std::string &what) : std::runtime_error(what), m_kind(kind) {}

    [[nodiscard]] Kind kind() const { return m_kind; }

private:
    Kind m_kind;
};

} // namespace pelliko::server
