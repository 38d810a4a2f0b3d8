// Runs the built tool as a person does: through the command processor, with files and standard
// streams.
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdint>
#include <cstdlib>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "support/bare_png.h"
#include "support/scratch_folder.h"

namespace zqtest {

struct Outcome {
    int status = 0;
    std::string out;
    std::string err;
};

// A folder with input files:
//   grey.png    3 x 2, 8-bit grey; its pixels are kGreyPixels
//   rgb.png     2 x 1, 8-bit RGB: (1, 2, 3) (4, 5, 6)
//   palette.png 3 x 1, indices 0 1 1 of red and green
//   deep.png    2 x 1, 16-bit grey 0 and 40000
//   float.aipd  2 x 1, 32-bit float
//   cut.png     the first half of grey.png
//   notes.txt   text
class ToolFolder : public ScratchFolder {
  public:
    // Among them what a text stream would change or end at.
    static constexpr const char* kGreyPixels = "\x0A\x0D\x0A\x1A\xFF\x09";

    ToolFolder() {
        using Rows = std::vector<std::vector<uint8_t>>;
        write_png("grey.png", 3, 8, PNG_COLOR_TYPE_GRAY, Rows{{10, 13, 10}, {26, 255, 9}});
        write_png("rgb.png", 2, 8, PNG_COLOR_TYPE_RGB, Rows{{1, 2, 3, 4, 5, 6}});
        write_png("palette.png", 3, 8, PNG_COLOR_TYPE_PALETTE, Rows{{0, 1, 1}});
        write_png("deep.png", 2, 16, PNG_COLOR_TYPE_GRAY, Rows{{0, 0, 0x9C, 0x40}});
        std::string header("AIPD\0\1\0\6\0\x20\0\1\0\2\0\0\0\2\0\1", 20);
        header.resize(512);
        store_bytes(path("float.aipd"), header + std::string("\0\0\x80\x3F\0\0\0\x40", 8));
        const std::string grey = load_bytes(path("grey.png"));
        store_bytes(path("cut.png"), grey.substr(0, grey.size() / 2));
        store_bytes(path("notes.txt"), "A file of some lines that is no picture.\n");
    }

    void write_png(const std::string& name, uint32_t width, int depth, int colour_type,
                   std::vector<std::vector<uint8_t>> rows) const {
        BarePng picture;
        picture.width = width;
        picture.height = static_cast<uint32_t>(rows.size());
        picture.depth = depth;
        picture.colour_type = colour_type;
        picture.rows = std::move(rows);
        if (colour_type == PNG_COLOR_TYPE_PALETTE) picture.palette = {{255, 0, 0}, {0, 255, 0}};
        write_bare_png(path(name), picture);
    }

    // @name in the arguments is that file of the folder. `input` is a file for standard input.
    Outcome run(const std::string& arguments, const std::string& input = "notes.txt") const {
        const std::string program = ZQVIS_PROGRAM;
        std::string line = program.find('/') == std::string::npos ? program : quoted(program);
        std::istringstream words(arguments);
        for (std::string word; words >> word;)
            line += " " + (word.front() == '@' ? quoted(path(word.substr(1))) : word);
        line += " <" + quoted(path(input)) + " >" + quoted(path("out.bin")) + " 2>" +
                quoted(path("err.bin"));
        const int status = std::system(line.c_str());
        return {status > 255 ? status >> 8 : status, load_bytes(path("out.bin")),
                without_returns(load_bytes(path("err.bin")))};
    }

    std::string bytes(const std::string& name) const { return load_bytes(path(name)); }

    // The pixels as `zqvis dump` gives them; empty when it fails.
    std::string dump(const std::string& name) const {
        const Outcome outcome = run("dump @" + name + " -o -");
        EXPECT_EQ(outcome.status, 0) << name << ": " << outcome.err;
        return outcome.status == 0 ? outcome.out : std::string();
    }

  private:
    static std::string quoted(const std::string& text) { return "\"" + text + "\""; }

    static std::string without_returns(std::string text) {
        std::erase(text, '\r');
        return text;
    }
};

using Text = testing::Matcher<std::string>;

// A run of the tool and what must come of it; carriage returns in its output do not count.
struct Case {
    const char* arguments;
    int status;
    Text out;
    Text err;
};

inline void run_cases(const ToolFolder& folder, const std::vector<Case>& cases) {
    for (const Case& one : cases) {
        SCOPED_TRACE(one.arguments);
        Outcome outcome = folder.run(one.arguments);
        std::erase(outcome.out, '\r');
        EXPECT_EQ(outcome.status, one.status) << outcome.err;
        EXPECT_THAT(outcome.out, one.out);
        EXPECT_THAT(outcome.err, one.err);
    }
}

}  // namespace zqtest
