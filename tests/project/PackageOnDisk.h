// A project package in its own folder, written by hand.
#pragma once

#include "platform/PropertyList.h"
#include "project/ProjectInformation.h"
#include "support/TemporaryFolder.h"
#include "support/URLs.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <string>

class PackageOnDisk {
public:
    explicit PackageOnDisk(const std::string& name = "Song.fuguex") : name_(name)
    {
        std::filesystem::create_directories(path() + "/Resources");
    }

    std::string path() const { return folder_ / name_; }
    std::string operator/(std::string_view item) const { return path() + '/' + std::string(item); }
    platform::URLRef url() const { return urlOf(path(), true); }
    const TemporaryFolder& folder() const { return folder_; }

    void moveTo(const std::string& name)
    {
        std::filesystem::rename(path(), folder_ / name);
        name_ = name;
    }
    /// Writes a file of the package, and creates the folders around it.
    void write(const std::string& item, BytesView content) const
    {
        std::filesystem::create_directories(std::filesystem::path(*this / item).parent_path());
        folder_.write(name_ + '/' + item, content);
    }
    void write(const std::string& item, std::string_view content) const { write(item, bytesOf(content)); }
    void writeList(const std::string& item, const platform::Value& value) const
    {
        write(item, *platform::writePropertyList(value, platform::PropertyListFormat::xml));
    }
    void writeInfo(const platform::Dictionary& info) const { writeList("Resources/ProjectInformation.plist", info); }
    void writeMetaData(const platform::Dictionary& metaData, const std::string& alternative = "Alternatives/000") const
    {
        writeList(alternative + "/MetaData.plist", metaData);
    }
    std::unique_ptr<ProjectInformation> open() const { return ProjectInformation::initWithProjectURL(url()); }

private:
    TemporaryFolder folder_;
    std::string name_;
};
