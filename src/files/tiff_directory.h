// The first directory of a TIFF file, looked at before libtiff does, which forgives too much.
#pragma once

#include "files/input_file.h"

namespace zq {

// Throws kUnableToReadData when the directory, or what one of its public tags points to, is not in
// the file: a file cut short. Private tags are their owners' affair; a picture does not need them.
// The position of the file is anywhere afterwards.
void check_tiff_directory(InputFile& file);

}  // namespace zq
