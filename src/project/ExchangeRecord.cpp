#include "project/ExchangeRecord.h"

#include "platform/PropertyList.h"
#include "platform/SmallFile.h"
#include "platform/SystemCalls.h"
#include "project/ProjectLists.h"

#include <cerrno>

using platform::Array;
using platform::Dictionary;

namespace {

constexpr const char* kName = ".exchange.dummy";
constexpr const char* kUnfinishedName = ".exchange.dummy.new";
constexpr const char* kBackupKey = "Backup";
constexpr const char* kItemsKey = "Items"; // for each exchanged name, the inode numbers in alternative and backup

bool isFolderName(const std::string& name)
{
    return !name.empty() && name != "." && name != ".." && name.find('/') == name.npos;
}

} // namespace

Bytes ExchangeRecord::bytes() const
{
    Array numbers;
    for (const ExchangeItem& item : items)
        numbers.emplace_back(Array{item.inAlternative, item.inBackup});
    return platform::writePropertyList(Dictionary{{kBackupKey, backup}, {kItemsKey, std::move(numbers)}},
                                       platform::PropertyListFormat::binary)
        .value_or(Bytes());
}

std::optional<ExchangeRecord> ExchangeRecord::fromBytes(BytesView bytes)
{
    const auto dictionary = dictionaryFromBytes(bytes, platform::PropertyListReading::strict);
    const auto* backup = dictionary ? platform::find<std::string>(*dictionary, kBackupKey) : nullptr;
    const auto* pairs = dictionary ? platform::find<Array>(*dictionary, kItemsKey) : nullptr;
    if (backup == nullptr || pairs == nullptr || pairs->size() != kExchangedNames.size() ||
        backup->find('\0') != backup->npos || !(isFolderName(*backup) || backup->starts_with('/')))
        return std::nullopt;
    ExchangeRecord record{*backup, {}};
    for (std::size_t i = 0; i < pairs->size(); ++i) {
        const auto* pair = (*pairs)[i].get<Array>();
        const auto* first = pair != nullptr && pair->size() == 2 ? (*pair)[0].get<std::int64_t>() : nullptr;
        const auto* second = first != nullptr ? (*pair)[1].get<std::int64_t>() : nullptr;
        if (second == nullptr)
            return std::nullopt;
        record.items.push_back(
            {kExchangedNames[i], static_cast<std::uint64_t>(*first), static_cast<std::uint64_t>(*second)});
    }
    return record;
}

std::string ExchangeRecord::pathIn(const std::string& alternativeFolder)
{
    return alternativeFolder + '/' + kName;
}

bool ExchangeRecord::write(const std::string& alternativeFolder) const
{
    const platform::SystemCalls& calls = platform::systemCalls();
    const std::string unfinished = alternativeFolder + '/' + kUnfinishedName;
    if (calls.removeFile(unfinished.c_str()) != 0 && errno != ENOENT) // left by a process that was killed
        return false;
    const int descriptor = calls.createFile(unfinished.c_str(), 0666);
    if (descriptor < 0)
        return false;
    bool good = platform::writeContent(descriptor, bytes()) && calls.fsync(descriptor) == 0;
    int reason = errno;
    if (calls.close(descriptor) != 0 && good) {
        good = false;
        reason = errno;
    }
    if (good && calls.renameWithoutReplacing(unfinished.c_str(), pathIn(alternativeFolder).c_str()) == 0) {
        if (calls.syncFolder(alternativeFolder.c_str()) == 0)
            return true;
        reason = errno;
        calls.removeFile(pathIn(alternativeFolder).c_str());
    } else {
        if (good)
            reason = errno;
        calls.removeFile(unfinished.c_str());
    }
    errno = reason;
    return false;
}
