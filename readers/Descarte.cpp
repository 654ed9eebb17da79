#include "Descarte.h"

#include <pthread.h>

#include <system_error>

namespace {

// Set and read by the main thread only: the module's app sets it when made and its
// Descarte clears it when destroyed.
Descarte* doModulo = nullptr;

}  // namespace

Descarte::~Descarte() {
    if (doModulo == this) doModulo = nullptr;
    {
        const std::lock_guard<std::mutex> trava(mutex_);
        parar_ = true;
    }
    temTrabalho_.notify_one();
    // The thread empties the queue before it stops: nothing handed over outlives this, nor
    // the module's code that the destructors run.
    if (thread_.joinable()) thread_.join();
}

Descarte* Descarte::DoModulo() {
    return doModulo;
}

void Descarte::DefinirDoModulo(Descarte* descarte) {
    doModulo = descarte;
}

bool Descarte::Iniciar() noexcept {
    const std::lock_guard<std::mutex> trava(mutex_);
    if (thread_.joinable()) return true;
    try {
        thread_ = std::thread([this] { Trabalhar(); });
    } catch (const std::system_error&) {
        return false;
    }
    // Named, so that a profile tells its time from the command's.
    pthread_setname_np(thread_.native_handle(), "zv-descarte");
    return true;
}

void Descarte::Enfileirar(Tarefa* tarefa) noexcept {
    {
        const std::lock_guard<std::mutex> trava(mutex_);
        if (ultima_)
            ultima_->proxima = tarefa;
        else
            primeira_ = tarefa;
        ultima_ = tarefa;
        ++pendentes_;
    }
    temTrabalho_.notify_one();
}

void Descarte::Esperar() {
    std::unique_lock<std::mutex> trava(mutex_);
    esvaziou_.wait(trava, [this] { return pendentes_ == 0; });
}

void Descarte::Trabalhar() {
    std::unique_lock<std::mutex> trava(mutex_);
    for (;;) {
        temTrabalho_.wait(trava, [this] { return primeira_ || parar_; });
        if (!primeira_) return;  // stopped with nothing left
        // The whole queue at once: the main thread hands over a few things per command.
        Tarefa* lote = std::exchange(primeira_, nullptr);
        ultima_ = nullptr;
        trava.unlock();
        std::size_t feitas = 0;
        while (lote) {
            Tarefa* proxima = lote->proxima;
            delete lote;
            lote = proxima;
            ++feitas;
        }
        trava.lock();
        pendentes_ -= feitas;
        if (pendentes_ == 0) esvaziou_.notify_all();
    }
}
