// What a launch request wants to share.
#pragma once

#include <app_control.h>

#include <cstdint>
#include <string>
#include <vector>

namespace pelliko::picker
{

struct Content {
    enum class Kind {
        nothing, ///< the request shares nothing
        files,
        text,
        contacts,
        again ///< the files of an earlier share
    };
    Kind kind = Kind::nothing;
    /// Of the files, without their folders; of an earlier share once they are known.
    std::vector<std::string> names;
    std::string text;
    /// How many contacts.
    size_t count = 0;
    /// Id of the earlier share.
    int32_t request = 0;
};

Content contentOf(app_control_h request);

/// Ids of the numbers that the request names as recipients already.
std::vector<int32_t> recipientsOf(app_control_h request);

} // namespace pelliko::picker
