// Members of chunks, and lists in them, as rules set them.
#pragma once

#include "audiofile/metadata/FixedText.h"
#include "audiofile/metadata/ListChunk.h"
#include "platform/core/Packed.h"
#include "tool/meta/MetaEdit.h"

#include <type_traits>

/// Its rule knows how long the text may be.
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

constexpr FourCC kListId = fourCC("LIST");

/// A list without items goes.
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
