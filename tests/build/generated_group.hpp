// The other half of the program beside_generated_code.cpp.
#pragma once

#include <string>

// A group made and encoded by protoc's code.
std::string generatedGroup();
