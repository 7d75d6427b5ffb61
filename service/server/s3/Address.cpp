#include "s3/Address.h"

#include <sys/stat.h>

#include <cstdlib>
#include <fstream>
#include <map>
#include <stdexcept>

namespace pelliko::server::s3
{
namespace
{

[[noreturn]] void refuse(const std::string &why)
{
    throw std::invalid_argument("the address of the S3 store " + why);
}

bool isOn(const std::string &name, const std::string &value)
{
    if (value != "on" && value != "off")
        refuse("has " + name + "=" + value + "; it is on or off");
    return value == "on";
}

void setOption(Address &address, const std::string &name, const std::string &value)
{
    if (value.empty())
        refuse("has no value after " + name + "=");
    if (name == "style" && (value == "path" || value == "virtual"))
        address.virtualHost = value == "virtual";
    else if (name == "style")
        refuse("has style=" + value + "; it is path or virtual");
    else if (name == "region")
        address.region = value;
    else if (name == "tls")
        address.tls = isOn(name, value);
    else if (name == "ca")
        address.caFile = value;
    else if (name == "credentials")
        address.credentialsFile = value;
    else if (name == "redirect")
        address.redirect = isOn(name, value);
    else
        refuse("has an unknown option " + name);
}

void setOptions(Address &address, std::string_view query)
{
    while (!query.empty()) {
        const auto end = query.find('&');
        const std::string_view option = query.substr(0, end);
        query = end == std::string_view::npos ? std::string_view() : query.substr(end + 1);
        const auto equals = option.find('=');
        if (equals == std::string_view::npos)
            refuse("has no value for " + std::string(option));
        setOption(address, std::string(option.substr(0, equals)),
                  std::string(option.substr(equals + 1)));
    }
}

std::string trimmed(const std::string &text)
{
    const auto first = text.find_first_not_of(" \t\r");
    return first == std::string::npos
               ? std::string()
               : text.substr(first, text.find_last_not_of(" \t\r") - first + 1);
}

/// "name = value" of every line that has one.
std::map<std::string, std::string> readValues(const std::string &path)
{
    struct stat info {
    };
    std::ifstream file(path);
    if (!file || stat(path.c_str(), &info) != 0)
        throw std::runtime_error("cannot read the store's credentials in " + path);
    if ((info.st_mode & S_IRWXO) != 0)
        throw std::runtime_error("the store's credentials in " + path +
                                 " are open to everybody: take that right away");
    std::map<std::string, std::string> values;
    for (std::string line; std::getline(file, line);) {
        const auto equals = line.find('=');
        if (equals != std::string::npos && line.front() != '#')
            values[trimmed(line.substr(0, equals))] = trimmed(line.substr(equals + 1));
    }
    return values;
}

std::string environment(const char *name)
{
    const char *value = std::getenv(name);
    return value == nullptr ? "" : value;
}

} // namespace

Address parseAddress(const std::string &url)
{
    const std::string scheme = "s3://";
    if (url.rfind(scheme, 0) != 0)
        refuse("does not begin with " + scheme);
    Address address;
    const auto question = url.find('?');
    if (question != std::string::npos)
        setOptions(address, std::string_view(url).substr(question + 1));
    std::string rest = url.substr(0, question).substr(scheme.size());
    const auto slash = rest.find('/');
    address.host = rest.substr(0, slash);
    // Whoever may list processes sees addresses.
    if (address.host.find('@') != std::string::npos)
        refuse("must not hold credentials: they come from the environment or a file");
    rest = slash == std::string::npos ? "" : rest.substr(slash + 1);
    const auto end = rest.find('/');
    address.bucket = rest.substr(0, end);
    if (address.host.empty() || address.bucket.empty())
        refuse("has to be like s3://host/bucket");
    address.prefix = end == std::string::npos ? "" : rest.substr(end + 1);
    while (!address.prefix.empty() && address.prefix.back() == '/')
        address.prefix.pop_back();
    if (!address.prefix.empty())
        address.prefix += '/';
    return address;
}

Credentials readCredentials(const Address &address)
{
    Credentials credentials;
    if (address.credentialsFile.empty()) {
        credentials = {environment("AWS_ACCESS_KEY_ID"), environment("AWS_SECRET_ACCESS_KEY"),
                       environment("AWS_SESSION_TOKEN")};
    } else {
        auto values = readValues(address.credentialsFile);
        credentials = {values["aws_access_key_id"], values["aws_secret_access_key"],
                       values["aws_session_token"]};
    }
    if (credentials.accessKey.empty() || credentials.secretKey.empty())
        throw std::runtime_error(
            "the S3 store needs credentials: AWS_ACCESS_KEY_ID and AWS_SECRET_ACCESS_KEY in the "
            "environment, or a file named by credentials= in its address");
    return credentials;
}

} // namespace pelliko::server::s3
