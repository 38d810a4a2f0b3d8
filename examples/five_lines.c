/* The example of the README: reads an image file of any type, says what it is, and writes it in the
 * native format. */
#include <stdio.h>
#include <zqvissvc/zqvissvc.h>

int main(int argc, char** argv) {
    if (argc != 3) return 2;
    ZqImageHandle image = kemoCreateImage(ZQ_TYPE_U8, 0);
    ZqError error = ZqReadFile(image, argv[1], NULL, NULL, NULL, NULL);
    if (!error) printf("%d x %d pixels\n", image->width, image->height);
    if (!error) error = ZqWriteFileByName(argv[2], image, NULL, "AIPD", NULL);
    ZqDisposeImage(image);
    return error != 0;
}
