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

}  // namespace zvlisp
