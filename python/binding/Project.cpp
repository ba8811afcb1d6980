// Project packages: what they say of themselves, under the names that `ktfiles project --json` has.
#include "binding/Bindings.h"
#include "binding/Interpreter.h"
#include "binding/Location.h"
#include "binding/Problem.h"
#include "binding/Values.h"

#include "project/ProjectDirectories.h"
#include "project/ProjectInformation.h"

#include <pybind11/stl.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <cstdlib>
#include <filesystem>
#include <mutex>

namespace py = pybind11;

namespace {

std::string resolvedFolder(const std::string& path)
{
    const std::unique_ptr<char, decltype(&std::free)> found(::realpath(path.c_str(), nullptr), &std::free);
    if (!found)
        throwSystemProblem(path, errno);
    std::error_code error;
    if (!std::filesystem::is_directory(found.get(), error))
        throwSystemProblem(path, ENOTDIR);
    return found.get();
}

std::optional<long> indexOf(const std::string& key)
{
    long index = 0;
    const auto [end, problem] = std::from_chars(key.data(), key.data() + key.size(), index);
    if (problem != std::errc() || end != key.data() + key.size() || index < 0)
        return std::nullopt;
    return index;
}

/// Any thread may ask; one at a time gets its turn.
class Project {
public:
    explicit Project(const std::string& path)
    {
        const Unlocked unlocked;
        const std::string folder = resolvedFolder(path);
        information_ = ProjectInformation::initWithProjectURL(platform::URL::createWithFileSystemBytes(folder, true));
        if (!information_)
            throw Problem(path, kStatusFileNotFound, // what makes a folder a package
                          "is no project package: Resources/ProjectInformation.plist cannot be read");
    }

    py::dict info() const { return objectFrom(information_->projectInfo()); }
    bool hasProjectFolder() const { return information_->hasProjectFolder(); }

    py::list alternatives() const
    {
        py::list made;
        const platform::Dictionary names = information_->alternativeNames();
        for (const std::string& key : information_->variationIndexesSorted()) {
            const auto* const name = platform::find<std::string>(names, key);
            const std::optional<long> index = indexOf(key);
            made.append(py::make_tuple(textFrom(key), index, name != nullptr ? py::object(textFrom(*name)) : py::none(),
                                       index && *index == information_->lastActiveVariation()));
        }
        return made;
    }

    py::object metadata(long index)
    {
        const platform::Dictionary* metadata = nullptr; // kept by the library, once it is read
        asking([&] { metadata = information_->loadMetaDataForVariant(index); });
        return metadata != nullptr ? py::object(objectFrom(*metadata)) : py::none();
    }

    py::dict music(long index)
    {
        asking([&] { information_->loadMetaDataForVariant(index); });
        py::dict made;
        made["tempo"] = information_->beatsPerMinute(index);
        made["sample_rate"] = information_->sampleRate(index);
        made["tracks"] = information_->numberOfTracks(index);
        made["key"] = textFrom(information_->songKeyAsNonLocalizedString(index).value_or(""));
        made["mode"] = textFrom(information_->songGenderAsNonLocalizedString(index).value_or(""));
        made["signature"] =
            py::make_tuple(information_->timeSignatureNumerator(index), information_->timeSignatureDenominator(index));
        return made;
    }

    /// Of one alternative, or of all: by key, the files in the order of their bytes.
    py::dict media(std::optional<long> index)
    {
        std::array<std::vector<std::string>, kProjectMediaLists.size()> files;
        asking([&] {
            for (std::size_t i = 0; i < files.size(); ++i) {
                const ProjectMediaKind kind = kProjectMediaLists[i].kind;
                const ProjectFileSet found = index ? information_->filesUsedByVariantIndex(kind, *index)
                                                   : information_->filesUsedByAnyVariant(kind);
                files[i].assign(found.begin(), found.end());
                std::ranges::sort(files[i]);
            }
        });
        py::dict made;
        for (std::size_t i = 0; i < files.size(); ++i) {
            py::list paths;
            for (const std::string& file : files[i])
                paths.append(py::bytes(file));
            made[kProjectMediaLists[i].key] = paths;
        }
        return made;
    }

    py::list backups(long index)
    {
        std::vector<ProjectBackup> found;
        asking([&] { found = ProjectInformation::backupsForBundleURL(information_->projectURL(), index); });
        py::list made;
        for (const ProjectBackup& backup : found)
            made.append(py::make_tuple(py::bytes(backup.url->posixPath()), objectFrom(platform::Value(backup.date))));
        return made;
    }

private:
    template <class Question>
    void asking(Question question)
    {
        const Unlocked unlocked;
        const std::lock_guard lock(mutex_);
        question();
    }

    std::mutex mutex_; // taken without the interpreter's lock only
    std::unique_ptr<ProjectInformation> information_;
};

} // namespace

void bindProject(py::module_& module)
{
    py::class_<Project>(module, "Project")
        .def(py::init<const std::string&>(), py::arg("path"))
        .def_property_readonly("info", &Project::info)
        .def_property_readonly("has_project_folder", &Project::hasProjectFolder)
        .def("alternatives", &Project::alternatives)
        .def("metadata", &Project::metadata, py::arg("index"))
        .def("music", &Project::music, py::arg("index"))
        .def("media", &Project::media, py::arg("index"))
        .def("backups", &Project::backups, py::arg("index"));
}
