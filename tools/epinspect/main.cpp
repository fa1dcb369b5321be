// epinspect: shows what EP files hold, and never writes one.
#include <clocale>

#include "Program.h"
#include "frame/Output.h"

int main(int argc, char** argv) {
    epinspect::prepareStreams();
    std::setlocale(LC_CTYPE, "");
    return epinspect::runProgram(argc, argv);
}
