// The program as a function: all of it but what is set for the process as a whole.
#pragma once

namespace epinspect {

/// Does what the arguments say and returns the exit status. Throws nothing.
int runProgram(int argc, char** argv);

}  // namespace epinspect
