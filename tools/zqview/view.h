// What part of an image a window shows: zoom and scrolled place, as the zoomed drawing calls take
// them. Client positions and offsets are device pixels.
#ifndef ZQVIEW_VIEW_H
#define ZQVIEW_VIEW_H

#include <cstdint>
#include <string>

struct Point {
    int32_t x, y;
    bool operator==(const Point&) const = default;
};

struct Extent {
    int32_t width, height;
    bool operator==(const Extent&) const = default;
};

class View {
  public:
    // Another image: one of the same size keeps zoom and place, any other is fitted.
    void show(Extent image);
    // The first that is not empty fits the image.
    void resize(Extent client);

    // 1 to 16 enlarges, -2 to -16 shrinks.
    int32_t zoom() const { return zoom_; }
    // "2:1", "1:3".
    std::string zoom_text() const;
    // What lies left of and above the client area; 0 on an axis where the whole image is seen.
    Point offset() const { return offset_; }

    // Enlarges (or shrinks, by a negative number) by steps of one; what the client position shows
    // stays there as far as the image reaches.
    void zoom_by(int32_t steps, Point about);
    void zoom_to(int32_t zoom, Point about);
    // One-to-one, or shrunk until all is seen.
    void fit();
    // Moves the image under the pointer's hand.
    void drag(int32_t dx, int32_t dy);

    Point centre() const { return {client_.width / 2, client_.height / 2}; }

  private:
    void clamp_offset();

    Extent image_{0, 0};
    Extent client_{0, 0};
    int32_t zoom_ = 1;
    Point offset_{0, 0};
};

#endif
