// A file of a coding that only a module decodes: frame n holds n, and n + 0.5 on the second channel. Delivers at most 7
// frames per call, as packet decoders do.
#pragma once

#include "media/decoding/AudioDecoder.h"
#include "media/decoding/DecoderModule.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <optional>

class FakeDecoder final : public platform::AudioDecoder {
public:
    struct File {
        FourCC formatId = fourCC(".mp3");
        FourCC fileType = fourCC("MPG3");
        std::uint64_t frames = 1000;
        std::uint64_t framesThere = ~std::uint64_t{0};          // fewer than promised
        std::optional<std::int64_t> validFrames = std::nullopt; // of the packet table
        bool hasFile = true;
        int seeks = 0;                            // done so far
        int failingSeek = 0;                      // number of the seek that fails
        std::uint64_t broken = ~std::uint64_t{0}; // a frame that cannot be read
    };

    /// During its lifetime, files other than linear PCM are opened as `file`; the real module converts rates.
    class Module {
    public:
        explicit Module(File& file)
        {
            opened = &file;
            platform::replaceDecoderModule(&module);
        }
        ~Module() { platform::replaceDecoderModule(nullptr); }

    private:
        static platform::AudioDecoder* open(const char*, std::int32_t*) { return new FakeDecoder(*opened); }
        static platform::Resampler* makeResampler(std::uint32_t channels, std::uint32_t from, std::uint32_t to,
                                                  std::int32_t* status)
        {
            platform::replaceDecoderModule(nullptr);
            const platform::DecoderModule* loaded = platform::decoderModule();
            platform::replaceDecoderModule(&module);
            return loaded != nullptr ? loaded->makeResampler(channels, from, to, status) : nullptr;
        }

        static inline File* opened;
        static inline const platform::DecoderModule module{platform::DecoderModule::currentVersion, nullptr, open,
                                                           makeResampler};
    };

    /// During its lifetime, there is no module.
    class NoModule {
    public:
        NoModule() { platform::replaceDecoderModule(&none); }
        ~NoModule() { platform::replaceDecoderModule(nullptr); }

    private:
        static inline const platform::DecoderModule none{};
    };

    explicit FakeDecoder(File& file) : file_(file), handle_(file.fileType)
    {
        format_ = platform::StreamDescription::packedPCM(44100, 2,
                                                         {.bits = 32, .isFloat = true, .order = std::endian::native});
        fileFormat_.formatId = file.formatId;
        fileFormat_.sampleRate = 44100;
        fileFormat_.channelsPerFrame = 2;
    }
    const platform::StreamDescription& fileFormat() const override { return fileFormat_; }
    const platform::StreamDescription& frameFormat() const override { return format_; }
    std::uint64_t frameCount() const override { return file_.frames; }
    platform::AudioHandle* file() override { return file_.hasFile ? &handle_ : nullptr; }
    bool packetTable(platform::PacketTable& table) const override
    {
        table.validFrames = file_.validFrames.value_or(0);
        return file_.validFrames.has_value();
    }
    std::int32_t seek(std::uint64_t frame) override
    {
        if (++file_.seeks == file_.failingSeek)
            return kStatusIOError;
        frame_ = frame;
        return kStatusOK;
    }
    std::int32_t read(std::uint32_t& frames, void* to) override
    {
        const std::uint64_t framesThere = std::min(file_.frames, file_.framesThere);
        frames = static_cast<std::uint32_t>(
            std::min<std::uint64_t>({frames, 7, framesThere - std::min(frame_, framesThere)}));
        for (std::uint32_t i = 0; i < frames; ++i, ++frame_) {
            if (frame_ == file_.broken)
                return kStatusIOError;
            static_cast<float*>(to)[2 * i] = static_cast<float>(frame_);
            static_cast<float*>(to)[2 * i + 1] = static_cast<float>(frame_) + 0.5F;
        }
        return kStatusOK;
    }

private:
    /// Knows its type and accepts no property.
    class Handle final : public platform::AudioHandle {
    public:
        explicit Handle(FourCC type) : AudioHandle(Kind::file), type_(type) {}
        std::int32_t propertyInfo(FourCC, std::uint32_t&, bool&) override { return -1; }
        std::int32_t property(FourCC id, std::uint32_t& size, void* data) override
        {
            return id == platform::AudioFile::fileTypeProperty ? give(&type_, sizeof type_, size, data) : -1;
        }
        std::int32_t setProperty(FourCC, std::uint32_t, const void*) override { return -1; }

    private:
        FourCC type_;
    };

    File& file_;
    Handle handle_;
    platform::StreamDescription fileFormat_, format_;
    std::uint64_t frame_ = 0;
};
