#include "files/AudioFileTypes.h"

#include <gtest/gtest.h>

TEST(AudioFileTypes, TheTableIsInItsOrder)
{
    const char* const rows[] = {"AIFF 6 .aif .L.aif .R.aif AIFF File",
                                "AIFF 4 .aif .ail .air AIFF File",
                                "AIFF 5 .aiff   AIFF File",
                                "WAVE 6 .wav .L.wav .R.wav Wave File PC",
                                "WAVE 4 .wav .wal .war Wave File PC",
                                ".WAV 6 .wav .L.wav .R.wav Wave File PC",
                                ".WAV 4 .wav .wal .war Wave File PC",
                                "caff 6 .caf .L.caf .R.caf CAF File",
                                "MPG3 6 .mp3 .L.mp3 .R.mp3 MP3 File",
                                "mpg4 4 .mp4   MP4 File",
                                "M4A  6 .m4a .L.m4a .R.m4a AAC File"};
    ASSERT_EQ(std::size(rows), kAudioFileTypeRows);
    for (int i = 0; i < kAudioFileTypeRows; ++i) {
        const AudioFileTypeRow& row = *CFileUtilAudioFileType(i);
        std::string found = fourCCText(row.type) + ' ' + std::to_string(row.suffixLength);
        for (const char* text : {row.extension, row.leftSuffix, row.rightSuffix, row.displayName})
            (found += ' ') += text;
        EXPECT_EQ(found, rows[i]);
    }
    EXPECT_EQ(CFileUtilAudioFileType(-1), nullptr);
    EXPECT_EQ(CFileUtilAudioFileType(kAudioFileTypeRows)->type, 0U);
}

TEST(AudioFileTypes, OfExtensions)
{
    // The whole table in order, written by hand from the list that hosts know.
    constexpr std::string_view expected =
        "aiff=AIFF aif=AIFF ail=AIFF air=AIFF aifc=AIFF wave=WAVE wav=WAVE war=WAVE wal=WAVE caf=caff aac=adts au=NeXT "
        "snd=NeXT ac3=ac-3 rex=REX  rx2=REX2 rcy=RCSO mp3=MPG3 mp4=mpg4 m4v=mpg4 m4a=M4A  adts=adts mov=MooV dv=MooV "
        "dvc=MooV avi=MooV mpg=MooV mpeg=MooV ubs=.ubs midi=Midi mid=Midi mxf=MXF  ";
    std::string rows;
    const AudioFileExtensionRow* row = CFileUtilAudioFileExtensions();
    for (; !row->extension.empty(); ++row) {
        rows += row->extension + '=' + fourCCText(row->type) + ' ';
        EXPECT_EQ(CFileUtilFileType(CFileRef(("/x/file." + row->extension).c_str(), false)), row->type);
    }
    EXPECT_EQ(row->type, 0U);
    EXPECT_EQ(rows, expected);

    struct Case {
        const char* path;
        FourCC type;
        bool isCompressed, isMovie;
    };
    const Case cases[] = {
        {"/x.MID", fourCC("Midi"), false, false},
        {"/x.Mp4", fourCC("mpg4"), true, true},
        {"/x.wav", fourCC("WAVE"), false, false},
        {"/x.mpegs", 0, false, false},
        {"/\xFF.wav", 0, false, false},
        {"/.wav", 0, false, false},
        {"", 0, false, false},
    };
    for (const Case& each : cases) {
        SCOPED_TRACE(each.path);
        const CFileRef file(each.path, false);
        EXPECT_EQ(CFileUtilFileType(file), each.type);
        EXPECT_EQ(CFileUtilIsCompressedFileType(file), each.isCompressed);
        EXPECT_EQ(CFileUtilIsMovieFileType(file), each.isMovie);
    }
}
