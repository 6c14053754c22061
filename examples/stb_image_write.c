// The PNG writer the embedding example uses, compiled once from its single header.
#define STB_IMAGE_WRITE_IMPLEMENTATION
#include <stb/stb_image_write.h>
