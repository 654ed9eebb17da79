#include "Interrupts.h"

#include "lisp/Interpreter.h"

#include <atomic>
#include <csignal>

namespace zvhost {

namespace {

// A signal handler may only touch lock-free atomics.
std::atomic<zvlisp::Interpreter*> watched{nullptr};
volatile std::sig_atomic_t interrupted = 0;

extern "C" void onInterrupt(int) {
    interrupted = 1;
    if (zvlisp::Interpreter* interpreter = watched.load()) interpreter->requestCancel();
    std::signal(SIGINT, SIG_DFL);
}

}  // namespace

void catchInterrupts(zvlisp::Interpreter* interpreter) {
    static_assert(std::atomic<zvlisp::Interpreter*>::is_always_lock_free);
    watched.store(interpreter);
    interrupted = 0;
    struct sigaction action {};
    action.sa_handler = onInterrupt;
    sigemptyset(&action.sa_mask);
    sigaction(SIGINT, &action, nullptr);
}

bool interruptRequested() {
    return interrupted != 0;
}

}  // namespace zvhost
