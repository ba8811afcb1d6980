#include "tool/overview/PNGFile.h"

#include "tool/shared/output/Failure.h"

#include <png.h>

#include <array>
#include <csetjmp>
#include <utility>

struct PNGFile::Writer {
    png_structp png = nullptr;
    png_infop info = nullptr;
    std::string bytes;
    std::string problem;

    ~Writer() { png_destroy_write_struct(&png, &info); }

    static void fail(png_structp png, png_const_charp message)
    {
        static_cast<Writer*>(png_get_error_ptr(png))->problem = message;
        png_longjmp(png, 1);
    }
    static void ignore(png_structp, png_const_charp) {}
    static void append(png_structp png, png_bytep data, std::size_t size)
    {
        static_cast<Writer*>(png_get_io_ptr(png))->bytes.append(reinterpret_cast<const char*>(data), size);
    }
    static void flush(png_structp) {}

    // libpng reports errors with a longjmp, so nothing in between may have a destructor.
    template <class Work>
    void run(const Work& work)
    {
        if (setjmp(png_jmpbuf(png)) == 0) {
            work();
            return;
        }
        throw Failure("no PNG can be made of it: " + problem);
    }
};

PNGFile::PNGFile(int width, int height, const PictureColors& colors) : writer_(std::make_unique<Writer>())
{
    constexpr int kFastCompression = 3;
    Writer& writer = *writer_;
    writer.png = png_create_write_struct(PNG_LIBPNG_VER_STRING, &writer, Writer::fail, Writer::ignore);
    writer.info = writer.png != nullptr ? png_create_info_struct(writer.png) : nullptr;
    if (writer.info == nullptr)
        throw Failure("no PNG can be made of it: out of memory");
    png_set_write_fn(writer.png, &writer, Writer::append, Writer::flush);
    const std::array<Color, 256> palette = Raster::palette(colors);
    std::array<png_color, 256> entries;
    std::array<png_byte, 256> alphas;
    bool isOpaque = true;
    for (std::size_t i = 0; i < palette.size(); ++i) {
        entries[i] = {palette[i].red, palette[i].green, palette[i].blue};
        alphas[i] = palette[i].alpha;
        isOpaque = isOpaque && alphas[i] == 255;
    }
    writer.run([&] {
        png_set_IHDR(writer.png, writer.info, static_cast<png_uint_32>(width), static_cast<png_uint_32>(height), 8,
                     PNG_COLOR_TYPE_PALETTE, PNG_INTERLACE_NONE, PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
        png_set_PLTE(writer.png, writer.info, entries.data(), static_cast<int>(entries.size()));
        if (!isOpaque)
            png_set_tRNS(writer.png, writer.info, alphas.data(), static_cast<int>(alphas.size()), nullptr);
        png_set_filter(writer.png, PNG_FILTER_TYPE_BASE, PNG_FILTER_NONE);
        png_set_compression_level(writer.png, kFastCompression);
        png_write_info(writer.png, writer.info);
    });
}

PNGFile::~PNGFile() = default;

void PNGFile::add(const Raster& rows)
{
    writer_->run([&] {
        for (int y = 0; y < rows.height(); ++y)
            png_write_row(writer_->png,
                          rows.pixels().data() + static_cast<std::size_t>(y) * static_cast<std::size_t>(rows.width()));
    });
}

void PNGFile::finish()
{
    writer_->run([&] { png_write_end(writer_->png, writer_->info); });
}

std::string PNGFile::take()
{
    return std::exchange(writer_->bytes, {});
}
