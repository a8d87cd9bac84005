// The stand-in host: the editor's side of the plug-in contract, as a program.

#include "host/app/ArchwayProgram.h"

int main(int argc, char** argv) { return Host::ArchwayProgram::Main(argc, argv); }
