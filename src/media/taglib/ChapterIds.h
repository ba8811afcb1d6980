// Hides the chapters of ID3v2 tags from TagLib, which reads nested chapters by recursion without a limit: some hundred
// KB of them would end the process. TagLib sees other ids, for which it makes unknown frames.
#pragma once

#include <array>
#include <string>
#include <string_view>
#include <taglib/tbytevector.h>

namespace platform::taglib {

struct HiddenId {
    std::string_view stated; // as it stands in files
    std::string_view hidden; // as TagLib sees it: letters that no text contains by chance
};

inline constexpr HiddenId kChapter = {"CHAP", "XQ7Z"};
inline constexpr HiddenId kContents = {"CTOC", "XQ8Z"};
inline constexpr std::array kHiddenIds = {kChapter, kContents};

/// Hides the ids wherever `bytes` contain them. Only a tag's frames matter, but nothing here tells where those are.
void hideChapterIds(TagLib::ByteVector& bytes);
/// Restores a hidden id in `text`.
void showChapterIds(std::string& text);

} // namespace platform::taglib
