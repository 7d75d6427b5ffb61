#include "Commands.h"

#include "RecordLog.h"

#include <cstring>
#include <ctime>
#include <iomanip>
#include <iostream>
#include <optional>
#include <sstream>

#include <nlohmann/json.hpp>

namespace pelliko::velmora
{
namespace
{
RecordLog usersLog()
{
    return RecordLog(RecordLogPlace::ofUser());
}

ExitCode failed(const char *action, int error)
{
    std::cerr << "velmora-log: cannot " << action << ": " << std::strerror(-error) << '\n';
    return ExitCode::Failure;
}

std::string textOf(const nlohmann::json &record, const char *key)
{
    const auto found = record.find(key);
    return found != record.end() && found->is_string() ? found->get<std::string>() : std::string();
}

// "2026-05-05T12:00:00Z" as the user's clock had it.
std::string localTime(const std::string &utc)
{
    std::tm parts{};
    std::istringstream in(utc);
    in >> std::get_time(&parts, "%Y-%m-%dT%H:%M:%SZ");
    const std::time_t time = timegm(&parts);
    std::tm local{};
    if (in.fail() || !localtime_r(&time, &local)) {
        return utc;
    }
    std::ostringstream out;
    out << std::put_time(&local, "%Y-%m-%d %H:%M:%S");
    return out.str();
}

std::optional<nlohmann::json> parse(const std::string &line)
{
    auto record = nlohmann::json::parse(line, nullptr, false);
    return record.is_object() ? std::optional(std::move(record)) : std::nullopt;
}

void print(const nlohmann::json &record)
{
    std::cout << localTime(textOf(record, "time")) << "  " << textOf(record, "feature") << "  "
              << std::left << std::setw(20) << textOf(record, "extra") << "  "
              << textOf(record, "app_id") << '\n';
}
} // namespace

ExitCode show(bool asJson)
{
    std::vector<std::string> lines;
    const int error = usersLog().read(lines);
    if (error != 0) {
        return failed("read the records", error);
    }
    int broken = 0;
    for (const std::string &line : lines) {
        const auto record = parse(line);
        if (!record) {
            ++broken;
        } else if (asJson) {
            std::cout << line << '\n';
        } else {
            print(*record);
        }
    }
    if (broken > 0) {
        std::cerr << "velmora-log: lines that are no records were left out: " << broken << '\n';
    }
    return ExitCode::Success;
}

ExitCode status()
{
    const RecordLog log = usersLog();
    std::vector<std::string> lines;
    const int error = log.read(lines);
    std::cout << "collecting: " << (log.collecting() ? "on" : "off") << '\n';
    if (error != 0) {
        return failed("read the records", error);
    }
    std::cout << "records: " << lines.size() << '\n' << "file: " << log.file() << '\n';
    return ExitCode::Success;
}

ExitCode setCollecting(bool on)
{
    const int error = usersLog().setCollecting(on);
    if (error != 0) {
        return failed(on ? "start collecting" : "stop collecting", error);
    }
    std::cout << "collecting: " << (on ? "on" : "off") << '\n';
    return ExitCode::Success;
}

ExitCode clear()
{
    const int error = usersLog().clear();
    return error == 0 ? ExitCode::Success : failed("take the records away", error);
}

} // namespace pelliko::velmora
