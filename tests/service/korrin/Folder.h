// A folder of a test's own that is gone after it.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>

struct Folder {
    Folder()
    {
        char name[] = "/tmp/account-XXXXXX";
        path = mkdtemp(name);
    }
    ~Folder() { std::filesystem::remove_all(path); }
    Folder(const Folder &) = delete;
    Folder &operator=(const Folder &) = delete;

    std::string file(const std::string &name) const { return (path / name).string(); }
    std::string make(const std::string &name, const std::string &text) const
    {
        std::ofstream(path / name) << text;
        return file(name);
    }

    std::filesystem::path path;
};

inline std::string readText(const std::string &file)
{
    std::ifstream stream(file);
    return {std::istreambuf_iterator<char>(stream), {}};
}
