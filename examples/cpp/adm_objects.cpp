// Lists the programmes of the ADM document in a broadcast wave file, with their objects. Usage: adm_objects FILE
#include "adm/ADMAudioContent.h"
#include "adm/ADMAudioObject.h"
#include "adm/ADMAudioProgramme.h"
#include "adm/ADMDocument.h"
#include "adm/ADMException.h"
#include "audiofile/CAudioFileIO.h"

#include <cstdio>
#include <filesystem>

namespace {

void show(const ADMDocument& document)
{
    for (const ADMAudioProgramme& programme : document.audioProgrammes()) {
        std::printf("%s\n", programme.audioProgrammeName().c_str());
        for (const ADMAudioContent* content : programme.audioContents())
            for (const ADMAudioObject* object : content->audioObjects()) {
                std::printf("  %s: %s from %.3f s", content->audioContentName().c_str(),
                            object->audioObjectName().c_str(), static_cast<double>(object->start()) / 1e6);
                if (object->duration() != kADMInvalidTime)
                    std::printf(" for %.3f s", static_cast<double>(object->duration()) / 1e6);
                std::printf(", %zu tracks\n", object->audioTrackUIDs().size());
            }
    }
}

} // namespace

int main(int argc, char** argv)
{
    if (argc != 2)
        return 2;
    const std::string path = std::filesystem::absolute(argv[1]);
    CAudioFileIO file;
    const std::int32_t status = file.OpenForChunks(CFileRef(path.c_str(), false), 0);
    std::optional<Bytes> xml = status == kStatusOK ? file.FindChunk(fourCC("axml")) : std::nullopt;
    if (!xml) {
        std::fprintf(stderr, "%s: %s\n", argv[1], status != kStatusOK ? StatusText(status) : "no ADM document");
        return 1;
    }
    try {
        const auto document = ADMDocument::initWithADMData(std::move(xml));
        if (document->parse()) {
            show(*document);
            return 0;
        }
        std::fprintf(stderr, "%s: %s\n", argv[1], document->parseError()->description.c_str());
    } catch (const ADMException& problem) { // well-formed XML that is not ADM
        std::fprintf(stderr, "%s: %s: %s\n", argv[1], problem.name().c_str(), problem.reason().c_str());
    }
    return 1;
}
