#include "files/AudioFileTypes.h"

#include <gtest/gtest.h>

TEST(AudioFileTypes, TheTableIsInItsOrder)
{
    struct Row {
        const char *type, *extension, *left, *right, *displayName;
    };
    const Row rows[] = {
        {"AIFF", ".aif", ".L.aif", ".R.aif", "AIFF File"},
        {"AIFF", ".aif", ".ail", ".air", "AIFF File"},
        {"AIFF", ".aiff", "", "", "AIFF File"},
        {"WAVE", ".wav", ".L.wav", ".R.wav", "Wave File PC"},
        {"WAVE", ".wav", ".wal", ".war", "Wave File PC"},
        {".WAV", ".wav", ".L.wav", ".R.wav", "Wave File PC"},
        {".WAV", ".wav", ".wal", ".war", "Wave File PC"},
        {"caff", ".caf", ".L.caf", ".R.caf", "CAF File"},
        {"MPG3", ".mp3", ".L.mp3", ".R.mp3", "MP3 File"},
        {"mpg4", ".mp4", "", "", "MP4 File"},
        {"M4A ", ".m4a", ".L.m4a", ".R.m4a", "AAC File"},
    };
    const int suffixLengths[] = {6, 4, 5, 6, 4, 6, 4, 6, 6, 4, 6};
    ASSERT_EQ(std::size(rows), kAudioFileTypeRows);
    for (int i = 0; i < kAudioFileTypeRows; ++i) {
        SCOPED_TRACE(i);
        const AudioFileTypeRow& row = *CFileUtilAudioFileType(i);
        const Row& expected = rows[i];
        EXPECT_EQ(fourCCText(row.type), expected.type);
        EXPECT_STREQ(row.extension, expected.extension);
        EXPECT_STREQ(row.leftSuffix, expected.left);
        EXPECT_STREQ(row.rightSuffix, expected.right);
        EXPECT_STREQ(row.displayName, expected.displayName);
        EXPECT_EQ(row.suffixLength, suffixLengths[i]);
    }
    EXPECT_EQ(CFileUtilAudioFileType(-1), nullptr);
    EXPECT_EQ(CFileUtilAudioFileType(kAudioFileTypeRows)->type, 0U);
}

TEST(AudioFileTypes, AreFoundByTheirFirstRow)
{
    EXPECT_EQ(CFileUtilGetPointAudioFileType(fourCC("AIFF")), CFileUtilAudioFileType(0));
    EXPECT_EQ(CFileUtilGetPointAudioFileType(fourCC(".WAV")), CFileUtilAudioFileType(5));
    EXPECT_STREQ(CFileUtilGetPointAudioFileType(fourCC("none"))->displayName, "Original Type");
    EXPECT_EQ(CFileUtilGetPointAudioFileType(0), CFileUtilAudioFileType(kAudioFileTypeRows));
}

TEST(AudioFileTypes, OfExtensions)
{
    // The whole table, in its order, as written by hand from the list that hosts know.
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
        {"/x.mov", fourCC("MooV"), true, true},
        {"/x.mxf", fourCC("MXF "), false, true},
        {"/x.ac3", fourCC("ac-3"), true, false},
        {"/x.m4a", fourCC("M4A "), true, false},
        {"/x.aac", fourCC("adts"), true, false},
        {"/x.mp3", fourCC("MPG3"), true, false},
        {"/x.wav", fourCC("WAVE"), false, false},
        {"/x.mpegs", 0, false, false},
        {"/\xFF.wav", 0, false, false},
        {"/.wav", 0, false, false},
        {"/wav", 0, false, false},
        {"/x.", 0, false, false},
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
