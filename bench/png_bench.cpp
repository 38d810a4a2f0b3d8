// PNG beside a bare loop over libpng with the same settings, in time and size, and beside OpenCV.
// Run: zqvis_bench --benchmark_filter=Png
#include <png.h>
#include <zqvissvc/custom_data.h>

#include <iterator>
#include <string>

#include "bare_png.h"
#include "photo_file.h"

namespace {

using zqbench::bare_png_read;
using zqbench::bare_png_write;
using zqbench::check;
using zqbench::FilePaths;
using zqbench::Image;
using zqbench::kPng;
using zqbench::PngShape;

struct Kind {
    int32_t type;
    PngShape shape;
};

constexpr Kind kKinds[] = {{ZQ_TYPE_U8, {PNG_COLOR_TYPE_GRAY, 8}},
                           {ZQ_TYPE_I16, {PNG_COLOR_TYPE_GRAY, 16}},
                           {ZQ_TYPE_RGB, {PNG_COLOR_TYPE_RGB, 8}},
                           {ZQ_TYPE_RGBU64, {PNG_COLOR_TYPE_RGB, 16}}};

// What one of these files holds, and the types that its samples come from and that it is read into.
struct Variant {
    const char* name;
    int32_t type;
    PngShape shape;
    int32_t read_type = type;
};

constexpr Variant kVariants[] = {
    {"1-bit grey", ZQ_TYPE_U8, {PNG_COLOR_TYPE_GRAY, 1}},
    {"2-bit grey", ZQ_TYPE_U8, {PNG_COLOR_TYPE_GRAY, 2}},
    {"4-bit grey", ZQ_TYPE_U8, {PNG_COLOR_TYPE_GRAY, 4}},
    {"1-bit indices", ZQ_TYPE_U8, {PNG_COLOR_TYPE_PALETTE, 1}},
    {"2-bit indices", ZQ_TYPE_U8, {PNG_COLOR_TYPE_PALETTE, 2}},
    {"4-bit indices", ZQ_TYPE_U8, {PNG_COLOR_TYPE_PALETTE, 4}},
    {"indices", ZQ_TYPE_U8, {PNG_COLOR_TYPE_PALETTE, 8}},
    {"grey and alpha", ZQ_TYPE_I16, {PNG_COLOR_TYPE_GRAY_ALPHA, 8}, ZQ_TYPE_RGB},
    {"RGB and alpha", ZQ_TYPE_RGB, {PNG_COLOR_TYPE_RGB_ALPHA, 8}},
    {"16-bit RGB and alpha", ZQ_TYPE_RGBU64, {PNG_COLOR_TYPE_RGB_ALPHA, 16}},
    {"interlaced grey", ZQ_TYPE_U8, {PNG_COLOR_TYPE_GRAY, 8, true}},
    {"interlaced 16-bit grey", ZQ_TYPE_I16, {PNG_COLOR_TYPE_GRAY, 16, true}},
    {"interlaced RGB", ZQ_TYPE_RGB, {PNG_COLOR_TYPE_RGB, 8, true}},
    {"interlaced 4-bit indices", ZQ_TYPE_U8, {PNG_COLOR_TYPE_PALETTE, 4, true}}};

// Strengths as in the compression setting 100 - s: level s / 10, and one filter or all.
zqbench::PngStrength strength_of(int strength) {
    constexpr int kFilters[] = {PNG_FILTER_NONE, PNG_FILTER_SUB, PNG_FILTER_UP, PNG_FILTER_AVG,
                                PNG_FILTER_PAETH};
    return {strength / 10, strength % 10 < 5 ? kFilters[strength % 10] : PNG_ALL_FILTERS};
}

constexpr int kUsualStrength = 66;

void PngWrite(benchmark::State& state) {
    const Kind& kind = kKinds[state.range(0)];
    const auto strength = static_cast<int>(state.range(1));
    const zqbench::Photograph image(kind.type);
    const FilePaths paths(".png");
    const bool usual = strength == kUsualStrength;
    zqbench::compare_write(
        state, paths.ours,
        [&] {
            zqbench::write_file(paths.ours, image, kPng, {1, {100 - strength, 0, 0}});
        },
        {{"libpng", paths.bare,
          [&] { bare_png_write(paths.bare, image, kind.shape, strength_of(strength)); }},
         {"OpenCV", paths.opencv,
          usual ? zqbench::opencv_write(paths.opencv, zqbench::pixels_of(image), "PNG")
                : zqbench::Job()}});
}

void compare_reads(benchmark::State& state, int32_t type, const PngShape& shape,
                   int32_t read_type) {
    const zqbench::Photograph image(type);
    const Image copy(read_type);
    const FilePaths paths(".png");
    bare_png_write(paths.bare, image, shape);
    zqbench::compare_read(state, paths.bare, read_type,
                          {{"libpng", [&] { bare_png_read(paths.bare); }},
                           {"OpenCV", zqbench::opencv_read(paths.bare)}});
    zqbench::read_file(paths.bare, copy);
    zqbench::check_same(copy, bare_png_read(paths.bare));
}

void PngRead(benchmark::State& state) {
    const Kind& kind = kKinds[state.range(0)];
    compare_reads(state, kind.type, kind.shape, kind.type);
}

void PngVariantRead(benchmark::State& state) {
    const Variant& variant = kVariants[state.range(0)];
    compare_reads(state, variant.type, variant.shape, variant.read_type);
    state.SetLabel(variant.name);
}

// A calibrated picture with an experiment's notes: 16 values of 4 KiB. Its files are compared with
// such without them: ours, and libpng's.
class Experiment : public zqbench::Photograph {
  public:
    explicit Experiment(const Kind& kind) : Photograph(kind.type) {
        handle()->unit = 3;
        handle()->xStep = handle()->yStep = 0.25F;
        const ZqImageValue to = value();
        std::string notes(4096, 'a');
        for (char key = 'a'; key < 'a' + 16; ++key) {
            const char name[] = {key, '\0'};
            for (size_t i = 0; i < notes.size(); ++i)
                notes[i] = static_cast<char>(i * i / 7 + static_cast<size_t>(key));
            check(DF_WriteCustomData(&to, name, notes.data(), static_cast<uint32_t>(notes.size()),
                                     nullptr) == 0,
                  "custom data");
        }
    }

    void write() const {
        const ZqImageValue from = value();
        check(DF_WriteImageAndVisionInfo(&from, paths.ours.c_str(), nullptr, nullptr) == 0,
              "write");
    }
    void read(const Image& target) const {
        const ZqImageValue to = target.value();
        check(DF_ReadImageAndVisionInfo(&to, paths.ours.c_str(), 0, nullptr, nullptr) == 0, "read");
    }

    FilePaths paths{".png"}, plain{"-plain.png"};
};

void PngVisionWrite(benchmark::State& state) {
    const Kind& kind = kKinds[state.range(0)];
    const Experiment image(kind);
    const FilePaths& paths = image.paths;
    zqbench::compare_write(
        state, paths.ours, [&] { image.write(); },
        {{"plain", image.plain.ours, [&] { zqbench::write_file(image.plain.ours, image, kPng); }},
         {"libpng", paths.bare, [&] { bare_png_write(paths.bare, image, kind.shape); }}});
}

void PngVisionRead(benchmark::State& state) {
    const Kind& kind = kKinds[state.range(0)];
    const Experiment image(kind);
    const Image copy(kind.type);
    image.write();
    zqbench::write_file(image.plain.ours, image, kPng);
    zqbench::compare_read(
        state, kind.type, [&](const Image& target) { image.read(target); },
        {{"plain", [&] { zqbench::read_file(image.plain.ours, Image(kind.type)); }},
         {"libpng", [&] { bare_png_read(image.paths.ours); }}});
    image.read(copy);
    zqbench::check_same(image, copy);
    const ZqImageValue value = copy.value();
    check(copy.handle()->unit == 3 && DF_RemoveCustomData(&value, "p", nullptr) == 0, "the notes");
}

BENCHMARK(PngWrite)
    ->ArgNames({"kind", "strength"})
    ->ArgsProduct({{0, 1, 2, 3}, {0, 11, 24, 30, 46, 60, kUsualStrength, 96}})
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond)
    ->Iterations(5);
BENCHMARK(PngRead)->ArgName("kind")->DenseRange(0, 3)->Apply(zqbench::timed_file);
BENCHMARK(PngVariantRead)->DenseRange(0, std::ssize(kVariants) - 1)->Apply(zqbench::timed_file);
BENCHMARK(PngVisionWrite)
    ->ArgName("kind")
    ->DenseRange(0, 3)
    ->Apply(zqbench::timed_file)
    ->Iterations(3);
BENCHMARK(PngVisionRead)->ArgName("kind")->DenseRange(0, 3)->Apply(zqbench::timed_file);

}  // namespace
