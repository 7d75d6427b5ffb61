// Exports that cannot be made, that are stopped, or that a crash ended.
#include <csignal>
#include <sys/resource.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

#include "ExportFiles.h"
#include "VcardScene.h"

namespace pelliko::contacts::test
{

TEST_F(VcardExport, APictureWhoseFileIsGoneIsLeftOut)
{
    ContactCard ann = card("Ann", "1");
    ann.picture = picture('a');
    const std::string id = addContact(ann);
    std::filesystem::remove_all(pictureFolder());
    EXPECT_EQ(readBack(exported({id}, 1).at(0))[0]["picture"], nullptr);
}

TEST_F(VcardExport, AnIdThatIsNoContactFailsTheWholeExport)
{
    const std::string ann = addContact(card("Ann", "1"));
    const struct {
        Names ids;
        int error;
    } rows[] = {
        {{ann, "99"}, CONTACTS_ERROR_NO_DATA},
        {{ann, "2147483648"}, CONTACTS_ERROR_INVALID_PARAMETER},
        {{"x"}, CONTACTS_ERROR_INVALID_PARAMETER},
        {{"1x"}, CONTACTS_ERROR_INVALID_PARAMETER},
        {{""}, CONTACTS_ERROR_INVALID_PARAMETER},
        {{"-1"}, CONTACTS_ERROR_INVALID_PARAMETER},
        {{"0"}, CONTACTS_ERROR_INVALID_PARAMETER},
        {{}, CONTACTS_ERROR_INVALID_PARAMETER},
    };
    for (const auto &row : rows) {
        for (const int share_mode : {0, 1}) {
            Calls calls;
            EXPECT_EQ(exported(row.ids, share_mode, calls), row.error);
            EXPECT_EQ(calls.names, Names{});
        }
    }
    EXPECT_EQ(left(), std::set<std::string>{});
}

TEST_F(VcardExport, ARowOfTheSharingServiceIsNoContact)
{
    add("Ann", {"1"}, true);
    Calls calls;
    EXPECT_EQ(exported({"2"}, 0, calls), CONTACTS_ERROR_NO_DATA);
}

TEST_F(VcardExport, WrongArgumentsAreRefused)
{
    char id[] = "1";
    char *ids[] = {id, nullptr};
    Calls calls;
    const std::string to = directory();
    const auto create = contacts_service_helper_create_vcard_files;
    const auto profile = contacts_service_helper_create_vcard_file_by_my_profile;
    addContact(card("Ann", "1"));
    EXPECT_EQ(create(nullptr, ids, 1, 0, note, &calls), CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(create(to.c_str(), nullptr, 1, 0, note, &calls), CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(create(to.c_str(), ids, 0, 0, note, &calls), CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(create(to.c_str(), ids, -1, 0, note, &calls), CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(create(to.c_str(), ids, 2, 0, note, &calls), CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(create(to.c_str(), ids, 1, 2, note, &calls), CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(create(to.c_str(), ids, 1, 0, nullptr, &calls), CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(profile(nullptr, nullptr, note, &calls), CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(profile(to.c_str(), nullptr, nullptr, &calls), CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(create("/nowhere/", ids, 1, 0, note, &calls), CONTACTS_ERROR_SYSTEM);
    EXPECT_EQ(create("/proc/", ids, 1, 0, note, &calls), CONTACTS_ERROR_SYSTEM);
    EXPECT_EQ(calls.names, Names{});
    EXPECT_EQ(left(), std::set<std::string>{});
}

TEST_F(VcardExport, AFileThatCannotGrowLeavesNothing)
{
    ContactCard big = card("Big", "1");
    big.picture = picture('b') + std::string(100000, 'b');
    const Names ids = {addContact(card("Ann", "2")), addContact(big)};
    const rlimit small = {50000, RLIM_INFINITY};
    rlimit before{};
    getrlimit(RLIMIT_FSIZE, &before);
    signal(SIGXFSZ, SIG_IGN);
    setrlimit(RLIMIT_FSIZE, &small);
    Calls calls;
    const int error = exported(ids, 1, calls);
    setrlimit(RLIMIT_FSIZE, &before);
    EXPECT_EQ(error, CONTACTS_ERROR_SYSTEM);
    EXPECT_EQ(calls.names, Names{});
    EXPECT_EQ(left(), std::set<std::string>{});
}

TEST_F(VcardExport, WhatACrashLeftIsClearedByTheNextExportAndWhatIsInUseStays)
{
    const std::string ann = addContact(card("Ann", "1"));
    // A program that ends amid an export leaves its hidden folder.
    const pid_t child = fork();
    if (child == 0) {
        auto *left_open = new ExportFiles(directory());
        left_open->begin("half");
        _exit(0);
    }
    waitpid(child, nullptr, 0);
    ASSERT_EQ(left().size(), 1U);
    std::ofstream(directory() + ".export-a-file") << "not ours";
    std::filesystem::create_directory(m_folder / "elsewhere");
    std::ofstream(m_folder / "elsewhere/kept") << "x";
    std::filesystem::create_directory_symlink(m_folder / "elsewhere", directory() + ".export-link");
    std::string going_on;
    {
        ExportFiles other(directory());
        other.begin("going on");
        other.write("text");
        EXPECT_EQ(exported({ann}, 1), Names{"Ann.vcf"});
        other.finish();
        going_on = other.publish(0);
    }
    EXPECT_EQ(text(going_on), "text");
    EXPECT_EQ(left(),
              (std::set<std::string>{".export-a-file", ".export-link", "Ann.vcf", "going on.vcf"}));
    EXPECT_TRUE(std::filesystem::exists(m_folder / "elsewhere/kept"));
}

TEST_F(VcardExport, TheCallbackMayStopTheExport)
{
    const Names ids = {addContact(card("Ann", "1")), addContact(card("Bob", "2")),
                       addContact(card("Cem", "3"))};
    Calls calls;
    calls.stop_after = 2;
    EXPECT_EQ(exported(ids, 1, calls), CONTACTS_ERROR_NONE);
    EXPECT_EQ(calls.names, (Names{"Ann.vcf", "Bob.vcf"}));
    EXPECT_EQ(left(), (std::set<std::string>{"Ann.vcf", "Bob.vcf"}));
}

} // namespace pelliko::contacts::test
