#include "Options.h"

#include <pelliko_operations.h>

#include <CLI/CLI.hpp>

#include <iostream>
#include <sstream>

namespace pelliko::applaunch
{

namespace
{

constexpr int kUsageStatus = 2;
constexpr const char *kPathStart = "appcontrol/";

constexpr const char *kFooter = R"(
Operations and keys that begin with "appcontrol/" get the prefix "http://tizen.org/".

Exit status: 0 the application has dealt with the request, or answered "succeeded"
             1 the request did not reach the application
             2 the command line is wrong
             3 the application answered "failed"
             4 nobody answered, or another answer came

Example:
  app-launch --app com.velmora.pelliko --operation appcontrol/operation/multi_share \
             --extra-array appcontrol/data/path=/tmp/a.jpg \
             --extra-array appcontrol/data/path=/tmp/b.pdf \
             --extra-array "appcontrol/data/to=7|")";

Options::Pair pairOf(const std::string &text)
{
    const std::size_t equals = text.find('=');
    return {withNamespace(text.substr(0, equals)), text.substr(equals + 1)};
}

std::vector<Options::Pair> pairsOf(const std::vector<std::string> &texts)
{
    std::vector<Options::Pair> pairs;
    pairs.reserve(texts.size());
    for (const std::string &text : texts)
        pairs.push_back(pairOf(text));
    return pairs;
}

// CLI11 prints a mistake over several lines; people get one sentence.
int complain(const CLI::ParseError &mistake)
{
    std::string sentence = mistake.what();
    std::cerr << "app-launch: " << sentence.substr(0, sentence.find('\n')) << "\n";
    return kUsageStatus;
}

std::string isPair(const std::string &text)
{
    const std::size_t equals = text.find('=');
    return equals == std::string::npos || equals == 0 ? "is not of the form KEY=VALUE" : "";
}

} // namespace

std::string withNamespace(const std::string &name)
{
    return name.rfind(kPathStart, 0) == 0 ? APP_CONTROL_NAMESPACE_PREFIX + name : name;
}

bool readOptions(int argc, char **argv, Options *options, int *status)
{
    std::vector<std::string> extras;
    std::vector<std::string> elements;
    CLI::App command("Sends a launch request to an application, starting it when needed.");
    command.footer(kFooter);
    command.add_option("--app", options->app, "Application id, such as com.velmora.pelliko")
        ->required();
    command.add_option("--operation", options->operation,
                       "Path of the operation, such as appcontrol/operation/share");
    command.add_option("--mime", options->mime, "MIME type");
    command.add_option("--uri", options->uri, "URI or path");
    const CLI::Validator pair(isPair, "KEY=VALUE");
    command.add_option("--extra", extras, "A text of extra data (repeatable)")
        ->check(pair)
        ->expected(1)
        ->multi_option_policy(CLI::MultiOptionPolicy::TakeAll);
    command.add_option("--extra-array", elements, "An element of an array (repeatable, in order)")
        ->check(pair)
        ->expected(1)
        ->multi_option_policy(CLI::MultiOptionPolicy::TakeAll);
    command.add_flag("--wait-reply", options->waitReply,
                     "Wait for the answer and print it as JSON");
    try {
        command.parse(argc, argv);
    } catch (const CLI::CallForHelp &help) {
        *status = command.exit(help);
        return false;
    } catch (const CLI::ParseError &mistake) {
        *status = complain(mistake);
        return false;
    }
    options->operation = withNamespace(options->operation);
    options->extras = pairsOf(extras);
    options->arrayElements = pairsOf(elements);
    return true;
}

} // namespace pelliko::applaunch
