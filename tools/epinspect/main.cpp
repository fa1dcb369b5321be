// epinspect: shows what EP files hold, and never writes one.
#include <clocale>

#include "Program.h"
#include "frame/Output.h"

int main(int argc, char** argv) {
    epinspect::prepareStreams();
    std::setlocale(LC_CTYPE, "");
#ifdef EPINSPECT_STATIC
    // For any other character set the C library would load a library of the machine, which need not fit.
    if (!epinspect::outputIsUnicode()) std::setlocale(LC_CTYPE, "C");
#endif
    return epinspect::runProgram(argc, argv);
}
