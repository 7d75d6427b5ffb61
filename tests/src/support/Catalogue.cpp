#include "support/Catalogue.h"

#include <clocale>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <libintl.h>

namespace pelliko::test
{

Catalogue::Catalogue(std::initializer_list<Text> texts)
{
    char name[] = "/tmp/catalogue.XXXXXX";
    directory_ = mkdtemp(name);
    const std::string messages = directory_ + "/tt/LC_MESSAGES";
    std::filesystem::create_directories(messages);
    std::ofstream po(directory_ + "/pelliko.po");
    po << "msgid \"\"\nmsgstr \"Content-Type: text/plain; charset=UTF-8\\n\"\n";
    for (const auto &[id, text] : texts)
        po << "msgid \"" << id << "\"\nmsgstr \"" << text << "\"\n";
    po.close();
    const std::string command =
        "msgfmt -o " + messages + "/pelliko.mo " + directory_ + "/pelliko.po";
    EXPECT_EQ(system(command.c_str()), 0) << command;
    setenv("LANGUAGE", "tt", 1);
    bindtextdomain("pelliko", directory_.c_str());
    bind_textdomain_codeset("pelliko", "UTF-8");
    EXPECT_NE(setlocale(LC_ALL, "C.UTF-8"), nullptr);
}

Catalogue::~Catalogue()
{
    unsetenv("LANGUAGE");
    setlocale(LC_ALL, "C");
    std::filesystem::remove_all(directory_);
}

} // namespace pelliko::test
