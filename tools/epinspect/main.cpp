// epinspect: shows what EP files hold, and never writes one.
#include <clocale>

#include "Output.h"
#include "Program.h"

int main(int argc, char** argv) {
    epinspect::prepareStreams();
    std::setlocale(LC_CTYPE, "");
    return epinspect::runProgram(argc, argv);
}
