// PNG with vision information: objects, and what damage does to them.
#include "support/vision_files.h"
#include "support/host_image.h"

namespace zqtest {
namespace {

TEST_F(VisionFilesTest, ObjectsTravelInTwoGroups) {
    Picture source(ZQ_TYPE_U8, 3, 2), target(ZQ_TYPE_SGL, 1, 1);
    attach(source, kPrivate, "secret");
    attach(source, kCommon, "note");
    attach(target, kCommon, "old");
    const ZqClassId unknown = {1, 2, 3, {}};
    attach(target, unknown, "old");
    attach(source, unknown, "has no class");
    const std::string file = written(source);
    EXPECT_EQ(inflated(file, "zqEI"), kWord + object(0xA4, kCommonBytes, "note"));
    EXPECT_EQ(inflated(file, "zqEi"), kWord + object(0xA6, kPrivateBytes, "secret"));
    ASSERT_EQ(ZqWriteFileByName(path_.c_str(), source.handle(), nullptr, "PNG", nullptr), 0);
    EXPECT_EQ(chunk_bytes(load_bytes(path_), "zqEI"), "") << "asked for the picture alone";

    ASSERT_EQ(read(target, file), 0);
    EXPECT_EQ(target.pixels(), source.pixels());
    EXPECT_EQ(note(target, kCommon), "note");
    EXPECT_EQ(note(target, kPrivate), "secret");
    EXPECT_EQ(note(target, unknown), "") << "what hung on the image before is gone";

    attach(source, kCommon, "mute");
    const std::string before = load_bytes(path_);
    const ZqImageValue image = source.value();
    EXPECT_EQ(DF_WriteImageAndVisionInfo(&image, path_.c_str(), nullptr, nullptr), -6);
    EXPECT_EQ(load_bytes(path_), before);
    EXPECT_EQ(folder_.count(), 1);
    attach(source, kCommon, "");
    EXPECT_EQ(inflated(written(source), "zqEI"), "") << "an empty object does not travel";
}

TEST_F(VisionFilesTest, ObjectsThatNobodyUnderstandsAreKept) {
    const std::string common = kWord + object(0xDEADBEEF, std::string(16, 'i'), "bytes") +
                               object(0x80000001, kCommonBytes, "bad");
    const std::string own = kWord + object(3, kPrivateBytes, "hidden");
    Picture picture(ZQ_TYPE_U8, 2, 2);
    const std::string bare = written(picture);
    forget_classes();
    for (const bool known : {false, true}) {
        if (known) know_classes();
        ASSERT_EQ(
            read(picture, with_chunks(bare, "zTXt",
                                      payload_chunk("zqEI", common) + payload_chunk("zqEi", own))),
            0);
        const std::string again = written(picture);
        EXPECT_EQ(inflated(again, "zqEI"), common);
        EXPECT_EQ(inflated(again, "zqEi"),
                  known ? kWord + object(0xA6, kPrivateBytes, "hidden") : own);
    }
}

TEST_F(VisionFilesTest, DamagedInformationIsLeftOut) {
    const std::string sound = kWord + object(1, kCommonBytes, "note");
    const std::string stream = deflated(sound);
    const auto changed = [&](size_t at, char byte) {
        std::string payload = sound;
        payload[at] = byte;
        return payload_chunk("zqEI", payload);
    };
    const auto chunk = [](size_t stated, const std::string& keyword, const std::string& bytes) {
        return png_chunk("zqEI", big_endian(stated) + keyword + bytes);
    };
    std::string wrong_sum = payload_chunk("zqEI", sound);
    wrong_sum.back() = static_cast<char>(wrong_sum.back() ^ 1);
    std::string many = kWord;
    for (uint32_t i = 0; i < 1001; ++i) {
        many += object(1, little_endian(i) + std::string(12, 'm'), "x");
    }
    const std::string custom_data_id(
        "\x96\x73\x45\xE5\x80\x34\xD0\x4D\x9C\xEA\x77\xB1\x79\x14\xEC"
        "A");
    struct Case {
        const char* name;
        std::string chunk;
        const char* before = "IDAT";
        const char* note = "";
    };
    const Case cases[] = {
        {"sound", payload_chunk("zqEI", sound), "IDAT", "note"},
        {"the first of two",
         payload_chunk("zqEI", sound) +
             payload_chunk("zqEI", kWord + object(1, kCommonBytes, "2nd")),
         "IDAT", "note"},
        {"behind the picture", payload_chunk("zqEI", sound), "IEND"},
        {"payload word", changed(0, 0x11)},
        {"header constant", changed(8, 5)},
        {"length too large", changed(12, 5)},
        {"length too small", changed(12, 3)},
        {"huge length", changed(15, '\xFF')},
        {"no bytes", payload_chunk("zqEI", kWord + object(1, kCommonBytes, ""))},
        {"second object cut",
         payload_chunk("zqEI", sound + object(1, kPrivateBytes, "x").substr(0, 28))},
        {"too many objects", payload_chunk("zqEI", many + sound.substr(4))},
        {"empty", payload_chunk("zqEI", "")},
        {"stated too long", chunk(sound.size() + 1, "ZQKEMO", stream)},
        {"stated too short", chunk(sound.size() - 1, "ZQKEMO", stream)},
        {"stated beyond reach", chunk(0xFFFFFFFF, "ZQKEMO", stream)},
        {"stream cut", chunk(sound.size(), "ZQKEMO", stream.substr(0, stream.size() - 1))},
        {"bytes behind the stream", chunk(sound.size(), "ZQKEMO", stream + '\0')},
        {"keyword", chunk(sound.size(), "ZQKEMo", stream)},
        {"short", png_chunk("zqEI", std::string(9, '\0'))},
        {"check sum", wrong_sum},
    };
    Picture source(ZQ_TYPE_U8, 2, 2), target(ZQ_TYPE_U8, 2, 2);
    const std::string file = written(source);
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        target.fill(9);
        ASSERT_EQ(read(target, with_chunks(file, c.before, c.chunk)), 0);
        EXPECT_EQ(target.pixels(), source.pixels());
        EXPECT_EQ(note(target, kCommon), c.note);
    }
    const std::string stolen = payload_chunk("zqEI", kWord + object(1, custom_data_id, "x"));
    ASSERT_EQ(
        read(target, with_chunks(file, "IDAT", stolen + png_chunk("tEXt", std::string("a\0b", 3)))),
        0);
    EXPECT_EQ(entries(target), (Entries{{"a", "b"}})) << "not pushed out by an object";
}

TEST_F(VisionFilesTest, EveryTruncationLeavesImageAndInformation) {
    Picture source(ZQ_TYPE_I16, 2, 2), target(ZQ_TYPE_U8, 2, 2);
    attach(source, kCommon, "new");
    keep(source, "key", "new");
    ASSERT_EQ(ZqSetBitDepth(source.handle(), 10), 0);
    attach(target, kCommon, "old");
    keep(target, "key", "old");
    target.handle()->unit = 3;
    const std::string file = written(source), before = target.state();
    for (size_t length = 0; length < file.size(); ++length) {
        ASSERT_NE(read(target, file.substr(0, length)), 0) << length;
        ASSERT_EQ(target.state(), before) << length;
        ASSERT_EQ(note(target, kCommon) + entries(target)["key"], "oldold") << length;
        ASSERT_EQ(target.record().unit, 3);
    }
    ASSERT_EQ(read(target, file), 0);
    EXPECT_EQ(note(target, kCommon) + entries(target)["key"], "newnew");
}

TEST_F(VisionFilesTest, HslIsWrittenAsRgb) {
    Picture hsl(ZQ_TYPE_HSL, 4, 3), rgb(ZQ_TYPE_RGB), target(ZQ_TYPE_U8);
    hsl.handle()->unit = 4, hsl.handle()->xStep = 2, hsl.handle()->yStep = 3;
    keep(hsl, "k", "v");
    const std::string before = hsl.state();
    ASSERT_EQ(ZqConvertImage(hsl.handle(), rgb.handle()), 0);
    ASSERT_EQ(read(target, written(hsl)), 0);
    EXPECT_EQ(hsl.state(), before);
    EXPECT_EQ(target.state(), rgb.state());
    EXPECT_EQ(target.record().unit, 4);
    EXPECT_EQ(target.record().yStep, 3);
    EXPECT_EQ(entries(target), (Entries{{"k", "v"}}));
    const Picture complex(ZQ_TYPE_COMPLEX, 2, 2);
    EXPECT_EQ(ZqWriteVisionFile(path_.c_str(), complex.handle(), nullptr, nullptr, nullptr),
              -1074396077);
}

TEST_F(VisionFilesTest, TheFileObjectHoldsTheParts) {
    ZqVisionFile* file = nullptr;
    ASSERT_EQ(ZqNewVisionFile(nullptr, &file), 0);
    const auto part = [&file](int32_t which) {
        const void* bytes = nullptr;
        uint32_t size = 1;
        EXPECT_EQ(ZqGetVisionPart(file, which, &bytes, &size), 0);
        EXPECT_EQ(bytes == nullptr, size == 0);
        return std::string(static_cast<const char*>(bytes), size);
    };
    Picture picture(ZQ_TYPE_U8, 2, 2), copy(ZQ_TYPE_U8);
    attach(picture, kCommon, "of the image");
    const std::string objects = kWord + object(1, kCommonBytes, "set"), timing(5000, 't');
    ASSERT_EQ(ZqSetVisionPart(file, ZQ_VISION_OBJECTS, objects.data(), 35), 0);
    ASSERT_EQ(ZqSetVisionPart(file, ZQ_VISION_TIMING, timing.data(), 5000), 0);
    ASSERT_EQ(ZqWriteVisionFile(path_.c_str(), picture.handle(), nullptr, nullptr, file), 0);
    EXPECT_EQ(inflated(load_bytes(path_), "pmTI", '\xDA'), timing);
    EXPECT_EQ(part(ZQ_VISION_VERSION) + part(ZQ_VISION_PRIVATE_OBJECTS), "");

    // The image keeps the payload that has no object, and writes it without the file object.
    ASSERT_EQ(ZqReadVisionFile(copy.handle(), path_.c_str(), nullptr, nullptr, nullptr), 0);
    EXPECT_EQ(note(copy, kCommon), "set");
    written(copy);
    ASSERT_EQ(ZqReadVisionFile(copy.handle(), path_.c_str(), nullptr, nullptr, file), 0);
    EXPECT_EQ(part(ZQ_VISION_TIMING), timing);
    EXPECT_EQ(part(ZQ_VISION_OBJECTS), kWord + object(0xA3, kCommonBytes, "set"));
    EXPECT_EQ(part(ZQ_VISION_VERSION), "Zorvane Kemo Vision 7.1.0");

    store_bytes(path_, "no picture");
    EXPECT_EQ(ZqReadVisionFile(copy.handle(), path_.c_str(), nullptr, nullptr, file), -1074395991);
    EXPECT_EQ(part(ZQ_VISION_TIMING), timing) << "as it was";
    EXPECT_EQ(ZqSetVisionPart(file, ZQ_VISION_VERSION, "x", 1), -1074395997);
    EXPECT_EQ(ZqSetVisionPart(file, ZQ_VISION_TIMING, nullptr, 1), -1074395269);
    EXPECT_EQ(ZqGetVisionPart(file, 4, nullptr, nullptr), -1074395997);
    EXPECT_EQ(ZqGetVisionPart(nullptr, 0, nullptr, nullptr), -1074395269);
    EXPECT_EQ(ZqNewVisionFile(nullptr, nullptr), -1074395269);
    EXPECT_EQ(ZqDisposeVisionFile(file), 0);
    EXPECT_EQ(ZqDisposeVisionFile(nullptr), 0);
}

TEST_F(VisionFilesTest, EntryPointsFollowTheProtocol) {
    HostImage image("vision", ZQ_TYPE_U8, 4, 4);
    std::vector<uint32_t> colours(256, 0x0A0B0C);
    refhost::ArrayU32 table(colours), wanted(std::vector<uint32_t>{1}), unwanted(wanted.elements());
    ASSERT_EQ(DF_WriteImageAndVisionInfo(&image.value, path_.c_str(), table.out(), nullptr), 0);
    ASSERT_EQ(DF_ReadImageAndVisionInfo(&image.value, path_.c_str(), 1, wanted.out(), nullptr), 0);
    ASSERT_EQ(DF_ReadImageAndVisionInfo(&image.value, path_.c_str(), 0, unwanted.out(), nullptr),
              0);
    ASSERT_EQ(DF_ReadImageAndVisionInfo(&image.value, path_.c_str(), 1, nullptr, nullptr), 0);
    EXPECT_EQ(wanted.elements(), colours);
    EXPECT_EQ(unwanted.elements(), std::vector<uint32_t>{1});

    Cluster no_path, no_file, pending(-7);
    EXPECT_EQ(DF_WriteImageAndVisionInfo(&image.value, "", nullptr, no_path), -1074395997);
    EXPECT_EQ(no_path.source(), "KEMO WriteImageAndVisionInfo\nInvalid parameter.");
    const std::string absent = folder_.path("absent.png");
    EXPECT_EQ(DF_ReadImageAndVisionInfo(&image.value, absent.c_str(), 0, nullptr, no_file),
              -1074395995);
    EXPECT_EQ(no_file.source(), "KEMO ReadImageAndVisionInfo\nFile not found.");
    EXPECT_EQ(DF_WriteImageAndVisionInfo(&image.value, absent.c_str(), nullptr, pending), -7);
    EXPECT_EQ(folder_.count(), 1);
    EXPECT_EQ(DF_ReadImageAndVisionInfo(&image.value, nullptr, 0, nullptr, nullptr), -1074395989);
}

}  // namespace
}  // namespace zqtest
