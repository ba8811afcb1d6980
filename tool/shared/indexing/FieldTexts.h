// What metadata fields say about a piece of music, whichever of the many names they have for it.
#pragma once

#include "audiofile/fields/MetaField.h"

#include <span>
#include <string>

struct LibraryRecord;

/// Fills title, artist, album, genre, comment, date, tempo and key, each from the first field that says it, in an order
/// of preference; what the record has already stays.
void addFieldTexts(LibraryRecord& record, std::span<const MetaField> fields);

/// All fields as a JSON array of objects with "name", "value" and perhaps "words". A long value is cut, and has "size",
/// its bytes; of very many fields the last are left out, and the last object counts them.
std::string fieldsJson(std::span<const MetaField> fields);
