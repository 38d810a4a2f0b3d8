// An open image file as the viewer shows it.
#ifndef ZQVIEW_DOCUMENT_H
#define ZQVIEW_DOCUMENT_H

#include <cstdint>
#include <memory>
#include <string>

#include "picture.h"
#include "view.h"

class Document {
  public:
    // A file that cannot be read is a Failure.
    explicit Document(std::string path);

    const std::string& path() const { return path_; }
    Extent extent() const { return {facts_.width, facts_.height}; }
    // "name - 640 x 480, RGB".
    std::string description() const;
    // "(x, y)  value" of a pixel by its components; empty outside the image.
    std::string value_at(Point pixel) const;

    // Draws it into a window's client area.
    void draw(void* window, const View& view, void* dc) const;

  private:
    std::string path_;
    std::unique_ptr<Picture> stored_;  // the pixels that values are taken from
    std::unique_ptr<Picture> shown_;   // with the colour table applied; null where there is none
    Facts facts_;
};

// The last part of a path.
std::string name_of(const std::string& path);

#endif
