// The name functions over arbitrary bytes and capacities: nothing outside the buffer is touched, and what was done to
// a name is seen in it. The first byte chooses the function, two give the capacity, the next the length of the
// extension; extension and name follow.
#include "files/AudioFileNames.h"

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

namespace {

void require(bool holds)
{
    if (!holds)
        std::abort();
}

/// As large as its capacity says, so that the sanitizers see a byte too many.
std::vector<char> bufferOf(const std::string& name, std::size_t capacity)
{
    std::vector<char> buffer(capacity, '#');
    if (capacity > 0) {
        const std::size_t length = std::min(name.size(), capacity - 1);
        name.copy(buffer.data(), length);
        buffer[length] = '\0';
    }
    return buffer;
}

void checkSetting(int which, const std::string& name, const std::string& extension, std::size_t capacity)
{
    std::vector<char> buffer = bufferOf(name, capacity);
    const int size = static_cast<int>(capacity);
    if (which == 0)
        CFileUtilSetNewExtension(buffer.data(), extension.c_str(), size);
    else if (which == 1)
        CFileUtilSetExtension(buffer.data(), extension.c_str(), size);
    else
        CFileUtilEnsureExtension(buffer.data(), extension.c_str(), size);
    require(capacity == 0 || std::memchr(buffer.data(), '\0', capacity) != nullptr);
    if (which == 2 && capacity > extension.size() + 2 && extension.size() < 1000)
        require(!CFileUtilEnsureExtension(buffer.data(), extension.c_str(), size) || extension.empty() ||
                extension == ".");
}

void checkStereo(const std::string& name)
{
    const int index = CFileUtilHasStereoExtension(name.c_str());
    const int point = CFileUtilGetPointExt(name.c_str());
    require((index < 0) == (point < 0) && index < kStereoSuffixes);
    std::vector<char> buffer = bufferOf(name, name.size() + 1);
    const int cut = CFileUtilHasStereoExtension(buffer.data(), kStereoCut | kStereoOrPlain);
    if (cut >= 0)
        require(std::string(buffer.data()).size() + std::strlen(CFileUtilGetStereoExtension(nullptr, cut)) ==
                name.size());
    else
        require((cut == -2) == (std::strlen(buffer.data()) < name.size()));
}

void checkCutting(const std::string& name, const std::string& extension)
{
    std::vector<char> buffer = bufferOf(name, name.size() + 1);
    const bool isCut = CFileUtilCutKnownAudioFileExtension(buffer.data());
    require(isCut == (std::strlen(buffer.data()) < name.size()) && name.starts_with(buffer.data()));
    require(!CFileUtilCutKnownAudioFileExtension(buffer.data()));
    require(name.empty() || buffer[0] != '\0');
    buffer = bufferOf(name, name.size() + 1);
    if (CFileUtilCutExtension(buffer.data(), extension.c_str()))
        require(std::strlen(buffer.data()) + extension.size() == name.size());
    buffer = bufferOf(name, name.size() + 1);
    if (CFileUtilCutExtension(buffer.data(), nullptr))
        require(name[std::strlen(buffer.data())] == '.');
}

void checkReference(const std::string& name, const std::string& extension)
{
    const CFileRef file(('/' + name).c_str(), false);
    CFileUtilFileType(file);
    CFileRef partner, back;
    if (CFileUtilGetStereoPartner(file, &partner))
        require(!partner.IsValid() || !CFileUtilGetStereoPartner(partner, &back) ||
                std::string(back).size() == std::string(file).size());
    for (const auto change : {+[](CFileRef*ref, const char*ext) { CFileUtilSetExtension(ref, ext); },
                              +[](CFileRef*ref, const char*ext) { CFileUtilEnsureExtension(ref, ext); },
                              +[](CFileRef*ref, const char*) { CFileUtilCutKnownAudioFileExtension(ref); }}) {
        CFileRef changed = file;
        change(&changed, extension.c_str());
        CFileUtilHasKnownAudioFileExtension(changed);
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    constexpr std::size_t header = 4;
    if (size < header)
        return 0;
    const std::size_t capacity = static_cast<unsigned>(data[1] | data[2] << 8) % 1100U;
    const std::size_t extensionLength = std::min<std::size_t>(data[3], size - header);
    const char* texts = reinterpret_cast<const char*>(data + header);
    // C strings: a NUL ends them.
    const std::string extension(std::string(texts, extensionLength).c_str());
    const std::string name(std::string(texts + extensionLength, size - header - extensionLength).c_str());
    switch (data[0] % 6) {
    case 0:
    case 1:
    case 2:
        checkSetting(data[0] % 6, name, extension, capacity);
        break;
    case 3:
        checkStereo(name);
        break;
    case 4:
        checkCutting(name, extension);
        break;
    default:
        checkReference(name, extension);
    }
    return 0;
}
