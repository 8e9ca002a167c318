// A folder of a test's own.
#pragma once

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <string>

class Folder
{
public:
    Folder()
    {
        std::string name = testing::TempDir() + "packaging-XXXXXX";
        EXPECT_TRUE(mkdtemp(name.data()));
        _path = name;
    }
    ~Folder()
    {
        std::error_code error;
        std::filesystem::remove_all(_path, error);
    }
    Folder(const Folder&) = delete;
    Folder& operator=(const Folder&) = delete;

    const std::string& path() const { return _path; }
    std::string operator/(const std::string& name) const { return _path + "/" + name; }

    /// Writes a file, with the folders above it.
    void write(const std::string& name, const std::string& text) const
    {
        std::filesystem::create_directories(std::filesystem::path(*this / name).parent_path());
        std::ofstream(*this / name) << text;
    }

private:
    std::string _path;
};
