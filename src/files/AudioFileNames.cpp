#include "files/AudioFileNames.h"

#include "platform/core/ASCIICase.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <string_view>

namespace {

constexpr std::size_t kNameSize = 1024;
constexpr std::size_t kShortNameSize = 256;

/// The last characters of a name as one number, in lower case, the last character lowest, so that "ends with" is one
/// comparison.
class Tail {
public:
    explicit constexpr Tail(std::string_view name) : length_(name.size())
    {
        for (const char c : name.substr(name.size() - std::min(name.size(), sizeof characters_)))
            characters_ = characters_ << 8 | static_cast<unsigned char>(asciiLower(c));
    }

    /// False for an empty text.
    constexpr bool endsWith(const Tail& text) const
    {
        const std::uint64_t mask = (std::uint64_t{1} << 8 * text.length_) - 1;
        return text.length_ > 0 && length_ >= text.length_ && (characters_ & mask) == text.characters_;
    }
    constexpr std::size_t length() const { return length_; }

private:
    std::uint64_t characters_ = 0;
    std::size_t length_;
};

/// The texts of one row of the audio file type table.
struct RowTails {
    Tail extension, left, right;
};

const std::array<RowTails, kAudioFileTypeRows>& rowTails()
{
    static const auto tails = []<std::size_t... row>(std::index_sequence<row...>)
    {
        const AudioFileTypeRow* rows = CFileUtilAudioFileType(0);
        return std::array{
            RowTails{Tail(rows[row].extension), Tail(rows[row].leftSuffix), Tail(rows[row].rightSuffix)}...};
    }
    (std::make_index_sequence<kAudioFileTypeRows>());
    return tails;
}

struct StereoSuffix {
    int index = -1;
    std::size_t length = 0;
};

StereoSuffix stereoSuffixOf(std::string_view name)
{
    if (name.size() < 2)
        return {};
    const Tail tail(name);
    int index = 0;
    for (const RowTails& row : rowTails())
        for (const Tail* suffix : {&row.left, &row.right}) {
            if (tail.endsWith(*suffix))
                return {index, suffix->length()};
            ++index;
        }
    return {};
}

/// The length of the first known extension or suffix that the name ends with and is longer than; 0 if there is none.
std::size_t knownExtensionLength(std::string_view name)
{
    const Tail tail(name);
    for (const RowTails& row : rowTails())
        for (const Tail* text : {&row.extension, &row.left, &row.right})
            if (text->length() < name.size() && tail.endsWith(*text))
                return text->length();
    return 0;
}

/// The name in a buffer of `size` bytes; at most `size` - 1 characters, so that there is room for the NUL.
std::string_view nameIn(char* name, int size)
{
    const std::size_t capacity = static_cast<std::size_t>(size);
    const std::size_t length = std::min(::strnlen(name, capacity), capacity - 1);
    name[length] = '\0';
    return {name, length};
}

std::string_view withoutDot(std::string_view extension)
{
    return extension.starts_with('.') ? extension.substr(1) : extension;
}

/// `extension` has no dot of its own.
void append(char* name, std::string_view extension, int size)
{
    const std::size_t capacity = static_cast<std::size_t>(size);
    const std::size_t needed = std::min(extension.size() + 2, capacity); // dot and NUL
    std::size_t end = std::min(nameIn(name, size).size(), capacity - needed);
    if (end + 1 < capacity)
        name[end++] = '.';
    const std::size_t copied = std::min(extension.size(), capacity - end - 1);
    std::copy_n(extension.data(), copied, name + end);
    name[end + copied] = '\0';
}

bool isNumber(std::string_view text)
{
    return std::all_of(text.begin(), text.end(), [](char c) { return c >= '0' && c <= '9'; });
}

/// Calls `change(char* name)` with the reference's name and renames the reference when that returns true.
template <class Change>
bool changeName(CFileRef* file, Change change)
{
    char name[kNameSize];
    return file != nullptr && file->GetFileName(name, sizeof name) && change(name) && file->ReplaceName(name, false);
}

} // namespace

int CFileUtilHasStereoExtension(char* name, int flags)
{
    if (name == nullptr)
        return -1;
    const std::string_view text = name;
    if (const StereoSuffix suffix = stereoSuffixOf(text); suffix.index >= 0) {
        const std::size_t position = text.size() - suffix.length;
        if ((flags & kStereoCut) != 0)
            name[position] = '\0';
        return (flags & kStereoPosition) != 0 ? static_cast<int>(position) : suffix.index;
    }
    if ((flags & kStereoOrPlain) == 0 || text.size() < 2)
        return -1;
    const Tail tail(text);
    for (const RowTails& row : rowTails())
        if (tail.endsWith(row.extension)) {
            name[text.size() - row.extension.length()] = '\0';
            return -2;
        }
    return -1;
}

namespace {

int stereoExtensionOfCopy(const char* name, int flags)
{
    char copy[kShortNameSize] = {};
    if (name != nullptr)
        std::memcpy(copy, name, ::strnlen(name, sizeof copy - 1));
    return CFileUtilHasStereoExtension(copy, flags);
}

} // namespace

int CFileUtilHasStereoExtension(const char* name)
{
    return stereoExtensionOfCopy(name, 0);
}

int CFileUtilGetPointExt(const char* name)
{
    return stereoExtensionOfCopy(name, kStereoPosition);
}

char* CFileUtilGetStereoExtension(char* out, int index)
{
    if (out != nullptr)
        *out = '\0';
    if (index < 0 || index >= kStereoSuffixes)
        return nullptr;
    const AudioFileTypeRow& row = *CFileUtilAudioFileType(index / 2);
    const char* suffix = index % 2 == 0 ? row.leftSuffix : row.rightSuffix;
    // Kept: the table's text is returned as if it could be changed; the caller must not change it.
    return out != nullptr ? std::strcpy(out, suffix) : const_cast<char*>(suffix);
}

bool CFileUtilGetStereoPartner(const CFileRef& file, CFileRef* partner)
{
    char path[kNameSize];
    if (!file.IsValid() || !file.GetPath(path, sizeof path))
        return false;
    const int index = CFileUtilHasStereoExtension(path, kStereoCut);
    if (index < 0)
        return false;
    const std::string other = std::string(path) + CFileUtilGetStereoExtension(nullptr, index ^ 1);
    if (partner != nullptr)
        partner->Set(other.c_str(), false);
    return true;
}

bool CFileUtilCutKnownAudioFileExtension(char* name)
{
    if (name == nullptr)
        return false;
    std::string_view text = name;
    const std::size_t before = text.size();
    while (const std::size_t length = knownExtensionLength(text))
        text.remove_suffix(length);
    name[text.size()] = '\0';
    return text.size() < before;
}

bool CFileUtilCutKnownAudioFileExtension(CFileRef* file)
{
    if (file == nullptr || !file->IsValid())
        return false;
    char text[kNameSize];
    // Kept: a reference without a base has its whole path cut, so a name that is only an extension goes too.
    const bool isWhole = file->URL()->baseURL() == nullptr;
    const bool fits = isWhole ? file->GetPath(text, sizeof text) : file->GetFileName(text, sizeof text);
    return fits && CFileUtilCutKnownAudioFileExtension(text) && file->Set(text, false);
}

bool CFileUtilHasKnownAudioFileExtension(const CFileRef& file)
{
    char name[kNameSize];
    return file.GetFileName(name, sizeof name) && knownExtensionLength(name) > 0;
}

bool CFileUtilEnsureExtension(char* name, const char* ext, int size)
{
    if (name == nullptr || size <= 0)
        return false;
    std::string dotted = "." + std::string(withoutDot(ext != nullptr ? ext : ""));
    dotted.resize(std::min(dotted.size(), kNameSize - 1));
    const std::string_view text = nameIn(name, size);
    if (text.size() >= dotted.size() && equalIgnoringASCIICase(text.substr(text.size() - dotted.size()), dotted))
        return false;
    CFileUtilCutKnownAudioFileExtension(name);
    if (dotted.size() > 1)
        append(name, std::string_view(dotted).substr(1), size);
    return true;
}

bool CFileUtilEnsureExtension(CFileRef* file, const char* ext)
{
    return changeName(file, [ext](char* name) { return CFileUtilEnsureExtension(name, ext, kNameSize); });
}

void CFileUtilSetExtension(char* name, const char* ext, int size)
{
    if (name == nullptr || size <= 0)
        return;
    const std::string_view extension = ext != nullptr ? ext : "";
    const std::string_view text = nameIn(name, size);
    if (ext != nullptr && extension.size() < text.size() && text.ends_with(extension))
        return;
    CFileUtilCutKnownAudioFileExtension(name);
    CFileUtilSetNewExtension(name, ext, size);
}

void CFileUtilSetExtension(CFileRef* file, const char* ext)
{
    changeName(file, [ext](char* name) {
        CFileUtilSetExtension(name, ext, kNameSize);
        return true;
    });
}

void CFileUtilSetNewExtension(char* name, const char* ext, int size)
{
    if (name != nullptr && size > 0 && ext != nullptr && *ext != '\0')
        append(name, withoutDot(ext), size);
}

bool CFileUtilCutExtension(char* name, const char* ext)
{
    if (name == nullptr)
        return false;
    const std::string_view text = name;
    if (ext != nullptr) {
        const std::string_view extension = ext;
        if (text.size() <= extension.size() ||
            !equalIgnoringASCIICase(text.substr(text.size() - extension.size()), extension))
            return false;
        name[text.size() - extension.size()] = '\0';
        return true;
    }
    constexpr std::size_t tooLong = 7;
    const std::size_t dot = text.rfind('.');
    if (dot == std::string_view::npos)
        return false;
    const std::string_view extension = text.substr(dot + 1);
    const bool isCut =
        !isNumber(extension) && (extension.size() < tooLong || equalIgnoringASCIICase(extension, "aupreset"));
    if (isCut)
        name[dot] = '\0';
    return isCut;
}
