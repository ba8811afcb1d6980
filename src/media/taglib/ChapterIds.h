// Chapters of ID3v2 tags are kept from TagLib, which reads chapters within chapters by recursion however deep a file
// nests them: some hundred KB would end the process. TagLib sees other ids for them, and makes frames that it does not
// know.
#pragma once

#include <array>
#include <string>
#include <string_view>
#include <taglib/tbytevector.h>

namespace platform::taglib {

struct HiddenId {
    std::string_view stated; // as it stands in files
    std::string_view hidden; // as TagLib sees it: letters that no text has by chance
};

inline constexpr HiddenId kChapter = {"CHAP", "XQ7Z"};
inline constexpr HiddenId kContents = {"CTOC", "XQ8Z"};
inline constexpr std::array kHiddenIds = {kChapter, kContents};

/// Hides the ids wherever `bytes` have them: only a tag's frames matter, but nothing tells here what is one.
void hideChapterIds(TagLib::ByteVector& bytes);
/// `text` of a hidden id, as it stands in the file.
void showChapterIds(std::string& text);

} // namespace platform::taglib
