#include "audiofile/CContainerEdit.h"

#include "platform/SystemCalls.h"
#include "platform/core/Status.h"

using Bodies = ChunkInventory::Bodies;

FileProblem CContainerEdit::Apply(const EditScope& scope, const Change& change)
{
    scope_ = scope;
    before_.reset();
    difference_ = {};
    return CSafeEdit::Apply(change);
}

std::int32_t CContainerEdit::LookBefore(int original)
{
    if (scope_.kind == EditScope::Kind::whole)
        return kStatusOK;
    before_.emplace();
    difference_ = before_->Take(original, scope_, Bodies::digests);
    return difference_.Status();
}

std::int32_t CContainerEdit::LookAfter(int original, int edited)
{
    if (scope_.kind == EditScope::Kind::whole)
        return kStatusOK;
    const bool isInPlace = before_.has_value();
    if (!isInPlace) {
        before_.emplace();
        difference_ = before_->Take(original, scope_, Bodies::whole);
    }
    ChunkInventory after;
    if (!difference_)
        difference_ = after.Take(edited, scope_, isInPlace ? Bodies::digests : Bodies::whole);
    if (!difference_)
        difference_ = before_->Compare(after);
    before_.reset();
    return difference_.Status();
}

/// Cuts off what a failed change left after the chunks, provided that nothing stood there before.
void CContainerEdit::CutBack(int edited)
{
    if (!before_ || before_->End() != before_->FileLength())
        return;
    ChunkInventory after;
    const platform::SystemCalls& calls = platform::systemCalls();
    if (!after.Take(edited, scope_, Bodies::digests) && after.End() < after.FileLength() &&
        calls.ftruncate(edited, after.End()) == 0)
        calls.fsync(edited); // the failure of the change itself is what gets reported
}
