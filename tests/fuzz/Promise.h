// What a fuzz target says when something that always has to hold does not.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string_view>

/// What the fuzzer calls before the first input, where a target has it, and with every input.
extern "C" int LLVMFuzzerInitialize(int *argc, char ***argv);
extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size);

namespace pelliko::fuzz
{

/// Ends the program when `kept` is false: the fuzzer keeps the input and prints the way here.
inline void promise(bool kept, const char *what)
{
    if (kept)
        return;
    std::fprintf(stderr, "broken promise: %s\n", what);
    std::abort();
}

inline std::string_view textOf(const uint8_t *data, size_t size)
{
    return {reinterpret_cast<const char *>(data), size};
}

/// Cuts the first line off the text, without its end.
inline std::string_view takeLine(std::string_view &text, char end = '\n')
{
    const size_t length = text.find(end);
    const std::string_view line = text.substr(0, length);
    text = length == std::string_view::npos ? std::string_view() : text.substr(length + 1);
    return line;
}

} // namespace pelliko::fuzz
