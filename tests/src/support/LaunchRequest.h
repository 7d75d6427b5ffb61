#pragma once

#include <app_control.h>
#include <string>
#include <vector>

namespace pelliko::test
{

/// A launch request as another application makes it.
class LaunchRequest
{
public:
    LaunchRequest() { app_control_create(&handle_); }
    ~LaunchRequest() { app_control_destroy(handle_); }
    LaunchRequest(const LaunchRequest &) = delete;
    LaunchRequest &operator=(const LaunchRequest &) = delete;

    LaunchRequest &text(const char *key, const std::string &value)
    {
        app_control_add_extra_data(handle_, key, value.c_str());
        return *this;
    }

    LaunchRequest &array(const char *key, const std::vector<std::string> &values)
    {
        std::vector<const char *> texts;
        for (const std::string &value : values)
            texts.push_back(value.c_str());
        app_control_add_extra_data_array(handle_, key, texts.data(),
                                         static_cast<int>(texts.size()));
        return *this;
    }

    operator app_control_h() const { return handle_; }

private:
    app_control_h handle_ = nullptr;
};

} // namespace pelliko::test
