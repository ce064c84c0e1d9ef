// tsd_gen: writes a synthetic property file, or the elements a trim of it
// should withdraw.
//
//   tsd_gen SHAPE N [--seed S] [-o FILE] [--remove-list K]
//
// --remove-list K prints the first K elements of the shape's withdrawal
// order, one per line (0: all of them), instead of the design.

#include "DesignGen.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <fstream>
#include <iostream>
#include <string>

namespace {

int usage(const std::string& problem) {
    std::cerr << "tsd_gen: " << problem << "\n"
              << "usage: tsd_gen SHAPE N [--seed S] [-o FILE] [--remove-list K]\n"
              << "shapes:";
    for (const std::string& shape : tsd_gen::shapeNames())
        std::cerr << " " << shape;
    std::cerr << "\n";
    return 2;
}

bool parseCount(const char* text, std::uint64_t& value) {
    if (text == nullptr || *text < '0' || *text > '9')
        return false;
    char* end = nullptr;
    errno = 0;
    unsigned long long parsed = std::strtoull(text, &end, 10);
    if (errno != 0 || *end != '\0')
        return false;
    value = parsed;
    return true;
}

} // namespace

int main(int argc, char** argv) {
    std::string shape;
    std::uint64_t n = 0;
    std::uint64_t seed = 1;
    std::uint64_t removeCount = 0;
    bool removeList = false;
    bool haveN = false;
    std::string outFile;
    for (int i = 1; i < argc; ++i) {
        std::string arg = argv[i];
        const char* next = i + 1 < argc ? argv[i + 1] : nullptr;
        if (arg == "--seed" || arg == "--remove-list") {
            std::uint64_t& target = arg == "--seed" ? seed : removeCount;
            if (!parseCount(next, target))
                return usage(arg + " needs a whole number");
            removeList = removeList || arg == "--remove-list";
            ++i;
        } else if (arg == "-o") {
            if (next == nullptr)
                return usage("-o needs a file");
            outFile = next;
            ++i;
        } else if (shape.empty()) {
            shape = arg;
        } else if (!haveN) {
            if (!parseCount(arg.c_str(), n))
                return usage("N must be a whole number, not \"" + arg + "\"");
            haveN = true;
        } else {
            return usage("unexpected argument \"" + arg + "\"");
        }
    }
    if (!haveN)
        return usage("SHAPE and N are required");
    if (!tsd_gen::isShape(shape))
        return usage("unknown shape \"" + shape + "\"");

    std::string text;
    try {
        tsd_gen::GenDesign design = tsd_gen::generate(shape, n, seed);
        if (removeList) {
            std::size_t count = design.removeOrder.size();
            if (removeCount != 0 && removeCount < count)
                count = static_cast<std::size_t>(removeCount);
            for (std::size_t k = 0; k < count; ++k)
                text += design.removeOrder[k] + "\n";
        } else {
            text = tsd_gen::designText(design, shape, n, seed);
        }
    } catch (const std::exception& e) {
        std::cerr << "tsd_gen: " << e.what() << "\n";
        return 2;
    }

    if (outFile.empty()) {
        std::cout << text;
        std::cout.flush();
        return std::cout ? 0 : 2;
    }
    std::ofstream out(outFile, std::ios::binary | std::ios::trunc);
    out << text;
    out.close();
    if (!out) {
        std::cerr << "tsd_gen: cannot write \"" << outFile << "\": " << std::strerror(errno)
                  << "\n";
        return 2;
    }
    return 0;
}
