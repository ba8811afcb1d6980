// Documents for the benchmarks, of any size and the same every time.
#pragma once

#include "platform/InputStream.h"

#include <string>

struct ADMDocumentShape {
    int objects = 1;
    int blocksPerObject = 1;
};

/// A document that is written while it is read, so that it is never in memory as a whole: a programme, a content, and
/// objects with moving positions, each with its pack, channel, stream and track format and its track UID.
class ADMDocumentStream : public platform::InputStream {
public:
    explicit ADMDocumentStream(ADMDocumentShape shape);
    std::ptrdiff_t read(std::span<std::byte> buffer) override;

private:
    void writeMore();
    void writeHead();
    void writeObject(int object);
    void writeBlock(int object, int block);
    void writeTail();

    ADMDocumentShape shape_;
    std::string text_; // written but not read yet
    std::size_t at_ = 0;
    int object_ = -1; // -1: the head is next
    int block_ = 0;
    bool isComplete_ = false;
};
