#include "audiofile/XStreamSaver.h"

XStreamSaver* XStreamSaver::s_First = nullptr;

XStreamSaver::XStreamSaver(void* stream, const CFileRef& ref) : next_(s_First), stream_(stream), ref_(ref)
{
    s_First = this;
}

XStreamSaver::~XStreamSaver()
{
    for (XStreamSaver** link = &s_First; *link != nullptr; link = &(*link)->next_) {
        if (*link == this) {
            *link = next_;
            break;
        }
    }
    if (stream_ != nullptr)
        XStreamClose(stream_);
}

XStreamSaver* XStreamSaver::FindXStreamObject(const CFileRef& ref)
{
    for (XStreamSaver* saver = s_First; saver != nullptr; saver = saver->next_)
        if (saver->ref_ == ref)
            return saver;
    return nullptr;
}
