// A text array of a launch request.
#pragma once

#include <app_control.h>
#include <cstdlib>

namespace pelliko
{

/// Owns the array that a request carries under a key; an element may be null.
class TextArray
{
public:
    TextArray(app_control_h request, const char *key)
        : result_(app_control_get_extra_data_array(request, key, &texts_, &length_))
    {
    }
    TextArray(const TextArray &) = delete;
    TextArray &operator=(const TextArray &) = delete;
    ~TextArray()
    {
        for (int i = 0; texts_ && i < length_; ++i)
            free(texts_[i]);
        free(texts_);
    }

    int result() const { return result_; } ///< app_control_error_e of the reading
    int length() const { return length_; }
    bool readable() const { return result_ == APP_CONTROL_ERROR_NONE; }
    bool filled() const { return readable() && texts_ && length_ > 0; }
    const char *operator[](int index) const { return texts_[index]; }
    char **data() { return texts_; } ///< borrowed; null when the request has none

private:
    char **texts_ = nullptr;
    int length_ = 0;
    int result_;
};

} // namespace pelliko
