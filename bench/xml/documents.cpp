#include "bench/xml/documents.h"

#include <random>

namespace bench {

namespace {

void addLoader(std::string& out, const std::string& loader, const std::string& file) {
    out += "                <getter class=\"" + loader + "\">\n";
    out += "                    <text>" + file + "</text>\n";
    out += "                </getter>\n";
}

void addColour(std::string& out, const std::string& name, std::minstd_rand& random) {
    out += "        <" + name;
    for (const char* component : {"a", "b", "g", "r"}) {
        const double value = std::uniform_int_distribution<int>(0, 1000)(random) / 1000.0;
        out += ' ';
        out += component;
        out += "=\"" + std::to_string(value) + '"';
    }
    out += "/>\n";
}

}  // namespace

std::string imageTable(std::int64_t bytes) {
    std::string out = "<?xml version=\"1.0\"?>\n<imagedefs>\n    <imageEntries>\n";
    for (int i = 0; static_cast<std::int64_t>(out.size()) < bytes; ++i) {
        const std::string name =
            (i % 10 == 0 ? "black &amp; white " : "picture ") + std::to_string(i);
        out += "        <imageEntry>\n            <name>" + name + "</name>\n";
        out += "            <getters>\n";
        addLoader(out, "TGAFileLoader", "Textures/" + name + ".tga");
        addLoader(out, "PellTGAFileLoader", "Data/" + name + ".pell");
        out += "            </getters>\n        </imageEntry>\n";
    }
    return out + "    </imageEntries>\n</imagedefs>\n";
}

std::string colourTable(std::int64_t bytes) {
    std::minstd_rand random(1);
    std::string out = "<?xml version=\"1.0\"?>\n<materials>\n";
    while (static_cast<std::int64_t>(out.size()) < bytes) {
        out += "    <material>\n";
        for (const char* colour : {"ambient", "diffuse", "specular", "emissive"})
            addColour(out, colour, random);
        out += "        <shininess>0.5</shininess>\n    </material>\n";
    }
    return out + "</materials>\n";
}

}  // namespace bench
