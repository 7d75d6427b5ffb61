#pragma once

#include "PellikoApp/ShareRequest.h"
#include "support/FileLog.h"
#include "support/LaunchRequest.h"
#include "support/UsageRecords.h"

#include <Ecore.h>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <string>
#include <vector>

namespace pelliko::test
{

/// A launch request to share and the files it may name.
class ShareRequest : public ::testing::Test
{
protected:
    static void SetUpTestSuite() { ecore_init(); }
    static void TearDownTestSuite() { ecore_shutdown(); }

    ShareRequest()
    {
        std::filesystem::create_directory(folder);
        unsupported_file_count = 99;
    }
    ~ShareRequest() override
    {
        freeUploadData(ad.upload_item);
        ad.upload_item = nullptr;
        std::filesystem::remove_all(folder);
    }

    // A file of that many bytes; its path.
    std::string file(const std::string &name, int64_t size = 100)
    {
        const std::string path = folder + "/" + name;
        std::ofstream out(path);
        out.close();
        std::filesystem::resize_file(path, static_cast<uintmax_t>(size));
        return path;
    }

    std::vector<std::string> files() const
    {
        std::vector<std::string> paths;
        for (const Eina_List *at = ad.upload_item->files; at; at = at->next)
            paths.emplace_back(static_cast<const char *>(at->data));
        return paths;
    }

    int single(const std::string &uri)
    {
        return _parseSingleDataPath(uri.c_str(), &ad, LaunchRequest());
    }

    int multiple(const std::vector<std::string> &paths)
    {
        return _parseMultipleDataPath(LaunchRequest().array(APP_CONTROL_DATA_PATH, paths), &ad);
    }

    const std::string folder = "/tmp/share-request";
    PellikoAppData ad;
    FileLog log;
    const UsageRecords usage;
};

} // namespace pelliko::test
