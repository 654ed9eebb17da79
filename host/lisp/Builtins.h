#pragma once
// The built-in functions, by family; each adds its functions to an interpreter.
namespace zvlisp {

class Interpreter;

void registerSpecialForms(Interpreter& in);
// Predicates, type, eval, apply, mapcar, symbols, errors and output.
void registerCoreBuiltins(Interpreter& in);
// Arithmetic, comparison, bits and geometry.
void registerMathBuiltins(Interpreter& in);
void registerListBuiltins(Interpreter& in);
// Strings, conversions, wcmatch and the number formats.
void registerStringBuiltins(Interpreter& in);
// Files, load and getenv.
void registerFileBuiltins(Interpreter& in);
// File names, copying, renaming, sizes, times and folder listings (vl-file-*).
void registerFileSystemBuiltins(Interpreter& in);
// Units, versions, memory calls kept for old programs, and the functions that need a
// screen or a system service this host lacks, which fail with their name.
void registerSystemBuiltins(Interpreter& in);

}  // namespace zvlisp
