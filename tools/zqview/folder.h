// The image files beside a file.
#ifndef ZQVIEW_FOLDER_H
#define ZQVIEW_FOLDER_H

#include <string>

// The image file that comes `steps` after the given one (before it, for a negative number) in the
// order of names, but not past the first and the last. Looks at the folder as it is now; the file
// itself may be gone. The file itself when its folder holds no other or cannot be read.
std::string neighbour(const std::string& file, int steps);

#endif
