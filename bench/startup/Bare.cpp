// A process that only links libxml2, reads the first bytes of a file and ends.
#include <libxml/parser.h>

#include <cstdio>

int main(int argc, char** argv)
{
    LIBXML_TEST_VERSION
    std::FILE* const file = argc < 2 ? nullptr : std::fopen(argv[1], "rb");
    if (file == nullptr)
        return 1;
    char bytes[512 * 16];
    const std::size_t done = std::fread(bytes, 1, sizeof bytes, file);
    std::fclose(file);
    return done > 0 ? 0 : 1;
}
