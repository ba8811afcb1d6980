// PMName is a small owned string, stored in files with its length in front (docs/formats/pmname.md).
#pragma once

#include "files/CFileIO.h"

#include <exception>
#include <list>
#include <memory>
#include <string_view>

/// Thrown when memory for a name is short, or a stored length is negative.
class KT_EXPORT PMNameException : public std::exception {
public:
    /// `reason` is a literal, which is not copied.
    explicit PMNameException(const char* reason) : reason_(reason) {}
    ~PMNameException() override;
    /// The reason.
    const char* what() const noexcept override;

private:
    const char* reason_; // a literal
};

/// A text that it owns; null and empty are different values. Whatever allocates throws PMNameException when memory is
/// short.
class KT_EXPORT PMName {
public:
    PMName() = default;
    PMName(const char* text); // null for null
    /// Copies the text up to its first NUL.
    explicit PMName(std::string_view text);
    PMName(const PMName& other);
    PMName(PMName&& other) noexcept = default;
    PMName& operator=(PMName other) noexcept;
    ~PMName() = default;

    /// NUL-terminated, owned by the name until it changes; null for a null name.
    const char* Get() const { return text_.get(); }
    /// Get(); null for a null name.
    operator const char*() const { return Get(); }

    /// Appends a text; does nothing for a null or empty one.
    void Cat(const char* text);
    /// Appends the pieces between separators to `out`. One leading separator is skipped, and one at the end adds no
    /// empty piece; two in a row do.
    void GetElements(char separator, std::list<PMName>& out) const;

    /// Writes at the file's mark, through its write cache: a length of 2 bytes when `shortLength` is not 0, else of
    /// 8, then the characters. kStatusBadName, and nothing written, for a name that is too long for a 2-byte length.
    std::int32_t ToFile(CFileIO& file, unsigned char shortLength) const;
    /// Reads at the file's mark. A stored length of 0 leaves the name as it is. Throws PMNameException for a negative
    /// length; kStatusEndOfFile when the length goes beyond the file. The name changes only on success.
    std::int32_t FromFile(CFileIO& file, unsigned char shortLength);

private:
    std::string_view View() const;

    std::unique_ptr<char[]> text_;
};
