#include "files/PMName.h"

#include "platform/core/Packed.h"

#include <algorithm>
#include <array>
#include <limits>
#include <new>

namespace {

/// Room for `length` characters and the terminator, which is set.
std::unique_ptr<char[]> NewText(std::size_t length)
{
    std::unique_ptr<char[]> text(new (std::nothrow) char[length + 1]);
    if (!text)
        throw PMNameException("PMName: out of memory");
    text[length] = '\0';
    return text;
}

} // namespace

PMNameException::~PMNameException() = default;

const char* PMNameException::what() const noexcept
{
    return reason_;
}

PMName::PMName(std::string_view text) : text_(NewText(text.size()))
{
    std::copy(text.begin(), text.end(), text_.get());
}

PMName::PMName(const char* text)
{
    if (text != nullptr)
        *this = PMName(std::string_view(text));
}

PMName::PMName(const PMName& other) : PMName(other.Get())
{
}

PMName& PMName::operator=(PMName other) noexcept
{
    text_ = std::move(other.text_);
    return *this;
}

std::string_view PMName::View() const
{
    return text_ ? std::string_view(text_.get()) : std::string_view();
}

void PMName::Cat(const char* text)
{
    const std::string_view added = text != nullptr ? text : "";
    if (added.empty())
        return;
    const std::string_view old = View();
    auto joined = NewText(old.size() + added.size());
    std::copy(added.begin(), added.end(), std::copy(old.begin(), old.end(), joined.get()));
    text_ = std::move(joined);
}

void PMName::GetElements(char separator, std::list<PMName>& out) const
{
    std::string_view rest = View();
    if (!rest.empty() && rest.front() == separator)
        rest.remove_prefix(1);
    while (!rest.empty()) {
        const std::size_t length = std::min(rest.find(separator), rest.size());
        out.emplace_back(rest.substr(0, length));
        rest.remove_prefix(std::min(length + 1, rest.size()));
    }
}

std::int32_t PMName::ToFile(CFileIO& file, unsigned char shortLength) const
{
    const std::string_view text = View();
    std::array<char, 8> length;
    long lengthSize = 8;
    if (shortLength == 0) {
        storeLE(length.data(), static_cast<std::int64_t>(text.size()));
    } else {
        if (text.size() > std::numeric_limits<std::uint16_t>::max())
            return kStatusBadName;
        storeLE(length.data(), static_cast<std::uint16_t>(text.size()));
        lengthSize = 2;
    }
    const std::int32_t status = file.Write(length.data(), lengthSize);
    if (status != kStatusOK || text.empty())
        return status;
    return file.Write(text.data(), static_cast<long>(text.size()));
}

std::int32_t PMName::FromFile(CFileIO& file, unsigned char shortLength)
{
    std::array<char, 8> field;
    std::int32_t status = file.Read(field.data(), shortLength != 0 ? 2L : 8L);
    if (status != kStatusOK)
        return status;
    const std::int64_t length =
        shortLength != 0 ? loadLE<std::uint16_t>(field.data()) : loadLE<std::int64_t>(field.data());
    if (length < 0)
        throw PMNameException("PMName: negative length in file");
    if (length == 0)
        return kStatusOK; // Kept: the old text stays
    if (length > file.GetEOF() - file.GetMark())
        return kStatusEndOfFile;
    auto text = NewText(static_cast<std::size_t>(length));
    status = file.Read(text.get(), static_cast<long>(length));
    if (status == kStatusOK)
        text_ = std::move(text);
    return status;
}
