#include <ISCSIEPFileMAP.h>

#include <iostream>

int main(int argc, char** argv) {
    if (argc != 2) return 2;
    ISCSI::TOOL::ISCSIEPFileMAP map(argv[1]);
    if (const int error = map.parseFile()) {
        std::cerr << argv[1] << ": error " << error << '\n';
        return 1;
    }
    std::cout << map.toString();
    ISCSI::TOOL::ISCSIEPMapEntryInfo entry;
    if (map.getMapEntry(0, entry) == 0) std::cout << entry.toString();
}
