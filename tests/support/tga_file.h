#pragma once

#include <string>

namespace pells_test {

/// A TGA header that claims a picture of some size; flags 0x20 says that rows come top first. Type
/// 0 stands for the plain type of the depth.
inline std::string tgaHeader(int width, int height, int depth, int flags = 0x20, int type = 0) {
    std::string header(12, '\0');
    header[2] = static_cast<char>(type != 0 ? type : depth == 8 ? 3 : 2);
    for (const int number : {width, width >> 8, height, height >> 8, depth, flags})
        header += static_cast<char>(number & 0xFF);
    return header;
}

/// A whole TGA file whose bytes all differ from their neighbours.
inline std::string tgaFile(int width, int height, int depth, int flags = 0x20) {
    std::string file = tgaHeader(width, height, depth, flags);
    for (int i = 0; i < width * height * depth / 8; ++i)
        file += static_cast<char>(i * 7 + i / 251);
    return file;
}

}  // namespace pells_test
