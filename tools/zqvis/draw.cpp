// zqvis draw: what a window would show of an image file.
#include <zqvissvc/display.h>

#include <algorithm>
#include <cstring>
#include <memory>
#include <vector>

#include "batch.h"
#include "commands.h"
#include "failure.h"
#include "output_file.h"
#include "picture.h"
#include "size.h"
#include "streams.h"

namespace {

struct Options {
    std::string file;
    OutputFile output;
    int32_t zoom = 1;
    std::string client;
    std::vector<int32_t> offset = {0, 0};
};

class Canvas {
  public:
    explicit Canvas(Size size) { check(ZqNewCanvas(size.width, size.height, &handle_)); }
    ~Canvas() { ZqDisposeCanvas(handle_); }
    Canvas(const Canvas&) = delete;
    Canvas& operator=(const Canvas&) = delete;
    ZqDeviceContext handle() const { return handle_; }

  private:
    ZqDeviceContext handle_ = nullptr;
};

// To the nearest whole pixel, at least one; a side that no canvas has stays one.
int32_t scaled(int32_t side, int32_t zoom) {
    const int64_t larger = std::clamp(zoom, 1, 16);
    const int64_t smaller = std::clamp(-zoom, 1, 16);
    return static_cast<int32_t>(
        std::clamp<int64_t>((side * larger + smaller / 2) / smaller, 1, INT32_MAX));
}

void draw(const std::string& file, const Options& options) {
    const Input input(file);
    auto picture = std::make_unique<Picture>(input.path());
    if (!picture->colour_table().empty()) picture = picture->with_colours_applied();
    const Facts facts = picture->facts();
    const Size client = options.client.empty() ? Size{scaled(facts.width, options.zoom),
                                                      scaled(facts.height, options.zoom)}
                                               : to_size(options.client);
    const Canvas canvas(client);
    picture->draw(canvas.handle(), options.zoom, options.offset[0], options.offset[1]);
    Picture shown(ZQ_TYPE_RGB, client.width, client.height);
    const uint32_t* pixels = ZqGetCanvasPixels(canvas.handle());
    for (int32_t y = 0; y < client.height; ++y) {
        const std::span<uint8_t> row = shown.row(y);
        std::memcpy(row.data(), pixels, row.size());
        pixels += client.width;
    }
    write_picture(shown, options.output);
}

int run(const Options& options, bool quiet) {
    format_of(options.output);  // wrong usage, before anything is done
    return run_batch({options.file}, quiet, [&](const std::string& file) {
        draw(file, options);
        return std::string();
    });
}

}  // namespace

void add_draw(CLI::App& tool, Session& session) {
    CLI::App* command = tool.add_subcommand("draw", "Draws what a window would show of an image");
    auto options = std::make_shared<Options>();
    command->add_option("FILE", options->file, "Image file; - is standard input")->required();
    add_output_option(*command, options->output);
    command->add_option("--zoom", options->zoom, "1 to 16 enlarges, -1 to -16 shrinks")
        ->check(CLI::Range(-16, 16))
        ->capture_default_str();
    add_size_option(*command, "--client", options->client,
                    "WIDTHxHEIGHT of the window, in pixels; else the zoomed image's");
    command->add_option("--offset", options->offset, "X,Y scrolled by, in pixels of the window")
        ->delimiter(',')
        ->expected(2);
    command->callback([options, &session] { session.status = run(*options, session.quiet); });
}
