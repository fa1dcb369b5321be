// epsample: writes a sample LUN store to try the tools on.
#include <CLI/CLI.hpp>
#include <cstdint>
#include <exception>
#include <iostream>
#include <string>

#include "SampleStore.h"

int main(int argc, char** argv) {
    try {
        CLI::App app("Writes a small LUN store below a folder, the same at each run.", "epsample");
        std::string root;
        std::uint64_t mapEntries = 4096;
        app.add_option("DIR", root, "Folder that stands for / of the target; made when missing")->required();
        app.add_option("--map-entries", mapEntries, "Entries of the map file")->capture_default_str();
        try {
            app.parse(argc, argv);
        } catch (const CLI::ParseError& error) {
            return app.exit(error) == 0 ? 0 : 2;
        }
        epsample::writeSampleStore(root, mapEntries);
    } catch (const std::exception& error) {
        std::cerr << "epsample: " << error.what() << '\n';
        return 1;
    }
    return 0;
}
