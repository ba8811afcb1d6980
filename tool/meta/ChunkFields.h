// Members of chunks and lists in them, for rules.
#pragma once

#include "audiofile/metadata/FixedText.h"
#include "audiofile/metadata/ListChunk.h"
#include "platform/core/Packed.h"
#include "tool/meta/MetaEdit.h"

#include <type_traits>

/// The rule has limited the text's length.
template <std::size_t size>
void assign(FixedText<size>& field, const MetaStep& step)
{
    field.set(step.string());
}

template <class T>
void assign(Packed<T>& field, const MetaStep& step)
{
    if constexpr (std::is_floating_point_v<T>)
        field = static_cast<T>(step.decimal());
    else
        field = static_cast<T>(step.number());
}

/// The chunk with an id; an empty one if there is none. Refuses a damaged chunk.
template <class Chunk>
Chunk valueOf(MetaEdit& edit, FourCC id)
{
    const MetaChunk* const chunk = edit.find(id);
    auto value = chunk != nullptr ? Chunk::read(chunk->body) : Chunk();
    if (!value)
        MetaEdit::refuseDamaged(id);
    return *value;
}

/// Replaces the chunk with that id, or adds one.
template <class Chunk>
void putChunk(MetaEdit& edit, FourCC id, const Chunk& value)
{
    if (MetaChunk* const chunk = edit.find(id))
        edit.replace(*chunk, value.write());
    else
        edit.add(id, value.write());
}

constexpr FourCC kListId = fourCC("LIST");

/// Removes a list without items.
template <class List>
void putList(MetaEdit& edit, MetaChunk* chunk, const List& list)
{
    if (list.items().empty() && chunk != nullptr)
        edit.remove(*chunk);
    else if (chunk == nullptr && !list.items().empty())
        edit.add(kListId, list.write());
    else if (chunk != nullptr)
        if (Bytes body = list.write(); body != chunk->body)
            edit.replace(*chunk, std::move(body));
}

template <class List>
List listIn(const MetaChunk* chunk)
{
    auto list = chunk != nullptr ? List::read(chunk->body) : std::nullopt;
    return list ? std::move(*list) : List();
}
