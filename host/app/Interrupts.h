#pragma once
// Ctrl+C in the command-line host: the first SIGINT cancels the running LISP evaluation and
// marks the running command cancelled (nothing is saved after it); a second one ends the
// host at once, as the signal always does.
namespace zvlisp {
class Interpreter;
}

namespace zvhost {

// Catches SIGINT from now on; `interpreter` is the one whose evaluation a Ctrl+C stops.
void catchInterrupts(zvlisp::Interpreter* interpreter);
// Whether a Ctrl+C came since catchInterrupts().
bool interruptRequested();

}  // namespace zvhost
