#include "framework/metadata/FileTypes.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace vexo;
using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

TEST(FileTypes, TheTableIsInOrder) {
    EXPECT_THAT(FileTypeTable::shared().problems(), IsEmpty());
}

TEST(FileTypes, MovieExtensionsMeanMovies) {
    for (const char* extension :
         {"mov", "mp4", "m4v",  "dv",  "avi", "mts", "m2ts", "ts",    "mpg", "mpeg", "3gp",
          "3g2", "mkv", "webm", "mxf", "ogv", "flv", "wmv",  "fcmov", "asf", "qt",   "m2t",
          "tod", "mod", "vob",  "m1v", "m2v", "mpv", "divx", "ogm",   "rm"}) {
        const FileType* type = typeForExtension(extension);
        ASSERT_TRUE(type) << extension;
        EXPECT_TRUE(type->isMovie) << extension;
        EXPECT_THAT(type->contentTypeTree, Contains("public.movie")) << extension;
    }
}

TEST(FileTypes, SoundIsNoMovie) {
    for (const char* extension : {"m4a", "mp3", "wav", "aiff", "flac", "ogg", "mka", "weba", "au"}) {
        const FileType* type = typeForExtension(extension);
        ASSERT_TRUE(type) << extension;
        EXPECT_TRUE(type->isSound) << extension;
        EXPECT_FALSE(type->isMovie) << extension;
    }
}

TEST(FileTypes, PicturesAndDocumentsAreNeither) {
    for (const char* extension : {"jpg", "png", "gif", "txt", "plist", "pdf", "zip", "srt"}) {
        const FileType* type = typeForExtension(extension);
        ASSERT_TRUE(type) << extension;
        EXPECT_FALSE(type->isMovie || type->isSound || type->isPackage) << extension;
    }
}

TEST(FileTypes, TheCaseOfAnExtensionDoesNotMatter) {
    EXPECT_EQ(typeForExtension("MoV"), typeForExtension("mov"));
    EXPECT_TRUE(isPackageExtension("QNProject"));
}

TEST(FileTypes, UnknownExtensionsHaveNoType) {
    EXPECT_FALSE(typeForExtension(""));
    EXPECT_FALSE(typeForExtension("qqq"));
    EXPECT_FALSE(typeForExtension("m\xc3\xb6v"));
    EXPECT_FALSE(isPackageExtension("qqq"));
}

TEST(FileTypes, ATreeBeginsWithTheTypeItself) {
    EXPECT_THAT(typeForExtension("m4v")->contentTypeTree,
                ElementsAre("com.norvale.m4v-video", "public.mpeg-4", "public.movie",
                            "public.audiovisual-content", "public.data", "public.item", "public.content"));
}

TEST(FileTypes, AProgramStreamIsMPEG) {
    EXPECT_EQ(typeForExtension("mpg")->contentType, "public.mpeg");
}

TEST(FileTypes, AFrameCastMovieIsAMovie) {
    const FileType* type = FileTypeTable::shared().typeNamed("com.norvale.framecast-movie");
    ASSERT_TRUE(type);
    EXPECT_TRUE(type->isMovie);
}

TEST(FileTypes, ProgramsPlugInsAndDocumentFoldersArePackages) {
    for (const char* extension :
         {"qnproject", "app", "bundle", "framework", "plugin", "vxplugin", "rtfd", "pkg", "pages"})
        EXPECT_TRUE(isPackageExtension(extension)) << extension;
    for (const char* extension : {"localized", "d", "mov", "zip"})
        EXPECT_FALSE(isPackageExtension(extension)) << extension;
}

TEST(FileTypes, MimeTypesOfMoviesMeanMovies) {
    for (const char* mime :
         {"video/quicktime", "video/mp4", "video/x-msvideo", "video/vnd.avi", "video/mp2t"}) {
        const FileType* type = FileTypeTable::shared().typeForMime(mime);
        ASSERT_TRUE(type) << mime;
        EXPECT_TRUE(type->isMovie) << mime;
    }
    EXPECT_FALSE(FileTypeTable::shared().typeForMime("application/octet-stream"));
    EXPECT_FALSE(FileTypeTable::shared().typeForMime(""));
}

TEST(FileTypes, AProjectIsAPackageOnlyAsAFolder) {
    EXPECT_EQ(typeOfFolder("Trip.qnproject").kind, "Reelix Project");
    EXPECT_TRUE(typeOfFolder("Trip.qnproject").isPackage);
    EXPECT_EQ(typeOfFile("Trip.qnproject").contentType, "public.data");
}

TEST(FileTypes, AFolderNamedLikeAMovieIsAFolder) {
    EXPECT_EQ(typeOfFolder("clip.mov").contentType, "public.folder");
    EXPECT_EQ(typeOfFile("clip.mov").kind, "QuickTime movie");
    EXPECT_EQ(typeOfFile("clip").contentType, "public.data");
}

TEST(FileTypeTable, ATypeWithoutAKindTakesItsFirstParents) {
    const FileTypeTable table("[a]\nkind = Thing\n[b]\nparents = a\nextensions = x\n");
    EXPECT_THAT(table.problems(), IsEmpty());
    EXPECT_EQ(table.typeForExtension("x")->kind, "Thing");
}

TEST(FileTypeTable, MistakesAreNamedAndTheRestCounts) {
    const FileTypeTable table(
        "kind = lost\n[a]\nkind = Thing\nextensions = x\nnonsense\n[b]\nparents = c\nextensions = x "
        "y\nmime = m/m m/m\n[a]\n");
    EXPECT_THAT(table.problems(), ElementsAre(HasSubstr("before the first section"), HasSubstr("nonsense"),
                                              HasSubstr("unknown parent c"), HasSubstr("declared twice"),
                                              HasSubstr("extension x"), HasSubstr("MIME type m/m")));
    EXPECT_EQ(table.typeForMime("m/m")->contentType, "b");
    EXPECT_EQ(table.typeForExtension("x")->contentType, "a");
    EXPECT_EQ(table.typeForExtension("y")->contentType, "b");
}
