#pragma once
// The catalogue tool's exported entry ("zvhost catalogue ARGS..."): the arguments after
// "catalogue", and where its lines go (channel 1 output, 2 errors). Returns the exit status.
#include "CIFerramentaCatalogo.h"

extern "C" int zvCatalogueTool(int argc, const char* const* argv,
                               CIFerramentaCatalogo::Escrita escrita, void* contexto);
