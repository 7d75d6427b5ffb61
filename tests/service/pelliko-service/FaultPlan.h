// Plans for tests/support/fault-proxy
#pragma once

#include <string>
#include <vector>

/** A rule of the plan. */
inline std::string rule(const std::string &method, const std::string &path,
                        const std::string &fault, const std::string &more = {})
{
    return R"({"method": ")" + method + R"(", "path": ")" + path + R"(", "fault": ")" + fault +
           '"' + (more.empty() ? "" : ", " + more) + "}";
}

/** Somebody between answers, with a page that is no JSON. */
inline std::string answers(const std::string &method, const std::string &path, int status,
                           const std::string &more = R"("length": 200)")
{
    return rule(method, path, "answer", R"("status": )" + std::to_string(status) + ", " + more);
}

/** What a hotel's network says to everything until one has signed in. */
inline std::string hotelPage(const std::string &method, const std::string &path)
{
    return answers(method, path, 200,
                   R"("headers": {"Content-Type": "text/html"},)"
                   R"( "body": "<html>Welcome to the hotel</html>")");
}

/** An answer that asks for a second's rest. */
inline std::string rest(const std::string &method, const std::string &path, int status)
{
    return answers(method, path, status, R"("headers": {"Retry-After": "1"}, "length": 200)");
}

inline std::string plan(const std::vector<std::string> &rules)
{
    std::string text;
    for (const std::string &one : rules) {
        text += (text.empty() ? "[" : ", ") + one;
    }
    return text + "]";
}
