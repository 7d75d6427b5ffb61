// A request that cleans up after itself.
#pragma once

#include <app_control.h>

#include <cstdlib>
#include <optional>
#include <string>
#include <vector>

namespace pelliko::test
{

struct Request {
    Request() { app_control_create(&handle); }
    explicit Request(app_control_h taken) : handle(taken) {}
    ~Request() { app_control_destroy(handle); }
    Request(const Request &) = delete;
    Request &operator=(const Request &) = delete;

    int add(const char *key, const char *value) const
    {
        return app_control_add_extra_data(handle, key, value);
    }
    int addArray(const char *key, std::vector<const char *> values) const
    {
        return app_control_add_extra_data_array(handle, key, values.data(),
                                                static_cast<int>(values.size()));
    }
    /// The text of a key, or "error N".
    std::string text(const char *key) const
    {
        char *value = nullptr;
        const int code = app_control_get_extra_data(handle, key, &value);
        std::string copy = value ? value : "error " + std::to_string(code);
        free(value);
        return copy;
    }
    std::vector<std::optional<std::string>> array(const char *key) const
    {
        char **values = nullptr;
        int length = 0;
        std::vector<std::optional<std::string>> copy;
        if (app_control_get_extra_data_array(handle, key, &values, &length) != 0)
            return copy;
        for (int i = 0; i < length; ++i) {
            copy.push_back(values[i] ? std::optional<std::string>(values[i]) : std::nullopt);
            free(values[i]);
        }
        free(values);
        return copy;
    }

    app_control_h handle = nullptr;
};

} // namespace pelliko::test
