// JPEG 2000 files put together around a plain use of OpenJPEG's encoder.
#pragma once

#include <openjpeg.h>

#include <algorithm>
#include <cstdint>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace zqtest {

struct BareJpeg2000 {
    struct Component {
        int bits = 8;
        bool is_signed = false;
        uint32_t dx = 1, dy = 1;
        std::vector<int32_t> samples{};  // filled in where they are missing
    };

    uint32_t width = 21, height = 13;  // of the first component, at offsets that it divides
    uint32_t left = 0, top = 0;
    std::vector<Component> components{};
    int tile = 0;  // side; 0: one tile
    int resolutions = 3;
    int block = 64;  // side of code blocks
    int layers = 1;
    bool wavelet_float = false;
    char mct = 0;

    // Samples of a component from one edge to the other.
    static uint32_t count(uint32_t from, uint32_t length, uint32_t step) {
        return (from + length + step - 1) / step - (from + step - 1) / step;
    }

    // The code stream. Every sample differs from its neighbours; extremes are there.
    std::string encode() {
        std::vector<opj_image_cmptparm_t> shapes;
        for (Component& c : components) {
            opj_image_cmptparm_t shape{};
            shape.dx = c.dx;
            shape.dy = c.dy;
            shape.w = count(left, width, c.dx);
            shape.h = count(top, height, c.dy);
            shape.x0 = left;
            shape.y0 = top;
            shape.prec = static_cast<OPJ_UINT32>(c.bits);
            shape.sgnd = c.is_signed ? 1 : 0;
            const int32_t lowest = c.is_signed ? -(1 << (c.bits - 1)) : 0, range = 1 << c.bits;
            for (size_t i = c.samples.size(); i < size_t{shape.w} * shape.h; ++i) {
                const auto mixed = static_cast<int32_t>((i * 7919 + shapes.size() * 31) % 65536);
                c.samples.push_back(lowest + (i == 0 ? range - 1 : mixed % range));
            }
            shapes.push_back(shape);
        }
        opj_image_t* image = opj_image_create(static_cast<OPJ_UINT32>(shapes.size()), shapes.data(),
                                              OPJ_CLRSPC_UNSPECIFIED);
        image->x0 = left;
        image->y0 = top;
        image->x1 = left + width;
        image->y1 = top + height;
        for (size_t i = 0; i < components.size(); ++i)
            std::copy(components[i].samples.begin(), components[i].samples.end(),
                      image->comps[i].data);
        std::string bytes = run(image);
        opj_image_destroy(image);
        return bytes;
    }

  private:
    static OPJ_SIZE_T append(void* bytes, OPJ_SIZE_T size, void* target) {
        static_cast<std::string*>(target)->append(static_cast<char*>(bytes), size);
        return size;
    }

    std::string run(opj_image_t* image) const {
        opj_cparameters_t parameters;
        opj_set_default_encoder_parameters(&parameters);
        parameters.tcp_numlayers = layers;
        for (int i = 0; i + 1 < layers; ++i)
            parameters.tcp_rates[i] = static_cast<float>(4 * (layers - i));
        parameters.cp_disto_alloc = 1;
        parameters.numresolution = resolutions;
        parameters.cblockw_init = parameters.cblockh_init = block;
        parameters.irreversible = wavelet_float ? 1 : 0;
        parameters.tcp_mct = mct;
        if (tile != 0) {
            parameters.tile_size_on = OPJ_TRUE;
            parameters.cp_tdx = parameters.cp_tdy = tile;
        }
        std::string bytes;
        opj_stream_t* stream = opj_stream_create(4096, OPJ_FALSE);
        opj_stream_set_user_data(stream, &bytes, nullptr);
        opj_stream_set_write_function(stream, append);
        opj_codec_t* codec = opj_create_compress(OPJ_CODEC_J2K);
        const bool done = opj_setup_encoder(codec, &parameters, image) == OPJ_TRUE &&
                          opj_start_compress(codec, image, stream) == OPJ_TRUE &&
                          opj_encode(codec, stream) == OPJ_TRUE &&
                          opj_end_compress(codec, stream) == OPJ_TRUE;
        opj_destroy_codec(codec);
        opj_stream_destroy(stream);
        if (!done) throw std::runtime_error("JPEG 2000 not encoded");
        return bytes;
    }
};

inline std::string big_endian(uint64_t value, int bytes) {
    std::string text;
    while (bytes-- > 0) text += static_cast<char>(value >> (8 * bytes));
    return text;
}

inline std::string jp2_box(std::string_view name, std::string_view content) {
    return big_endian(content.size() + 8, 4).append(name).append(content);
}

// `header` is what stands in the header box behind the image header, which readers of the code
// stream do not need.
inline std::string jp2_file(std::string_view header, std::string_view stream) {
    return jp2_box("jP  ", "\r\n\x87\n") + jp2_box("ftyp", std::string("jp2 \0\0\0\0jp2 ", 12)) +
           jp2_box("jp2h", header) + jp2_box("jp2c", stream);
}

inline std::string jp2_colour(uint32_t enumerated) {
    return jp2_box("colr", std::string("\1\0\0", 3) + big_endian(enumerated, 4));
}

// Channel, type, association, for each channel.
inline std::string jp2_definitions(const std::vector<std::vector<uint16_t>>& channels) {
    std::string content = big_endian(channels.size(), 2);
    for (const auto& channel : channels)
        for (const uint16_t value : channel) content += big_endian(value, 2);
    return jp2_box("cdef", content);
}

}  // namespace zqtest
