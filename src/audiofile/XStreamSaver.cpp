#include "audiofile/XStreamSaver.h"

XStreamSaver* XStreamSaver::s_First = nullptr;

XStreamSaver::XStreamSaver(void* stream, const CFileRef& ref) : mNext(s_First), mStream(stream), mRef(ref)
{
    s_First = this;
}

XStreamSaver::~XStreamSaver()
{
    for (XStreamSaver** link = &s_First; *link != nullptr; link = &(*link)->mNext) {
        if (*link == this) {
            *link = mNext;
            break;
        }
    }
    if (mStream != nullptr)
        XStreamClose(mStream);
}

XStreamSaver* XStreamSaver::FindXStreamObject(const CFileRef& ref)
{
    for (XStreamSaver* saver = s_First; saver != nullptr; saver = saver->mNext)
        if (saver->mRef == ref)
            return saver;
    return nullptr;
}
