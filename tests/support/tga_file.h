#pragma once

#include <string>

namespace pells_test {

/// A TGA header that claims a picture of some size; flags 0x20 says that rows come top first.
inline std::string tgaHeader(int width, int height, int depth, int flags = 0x20) {
    std::string header(18, '\0');
    header[2] = depth == 8 ? 3 : 2;
    header[12] = static_cast<char>(width & 0xFF);
    header[13] = static_cast<char>(width >> 8);
    header[14] = static_cast<char>(height & 0xFF);
    header[15] = static_cast<char>(height >> 8);
    header[16] = static_cast<char>(depth);
    header[17] = static_cast<char>(flags);
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
