#pragma once
// Frees what a command is done with on a thread of its own, in the order it was handed
// over, while the command goes on: a list frees millions of items and readings right
// before the host saves the drawing, and the machine has a second core for that.
//
// Only what nobody else reaches may come here, and only things whose destruction touches
// nothing the main thread uses unguarded. Checked for what the lists hand over:
// - list items: their fields are QStrings under name numbers (the program's name table is
//   not touched by a destructor), their ids plain values, their links never followed;
// - the readers' kept readings: Qt and standard containers of QStrings, numbers, ids and
//   points; the pointers among them (shapes, catalogue answers) are never followed when
//   they go.
// QString and the Qt containers count their sharing atomically, so a text an item shares
// with a LISP answer, the catalogue, a template or the drawing's strings goes with its last
// owner on either thread. Never hand over: result buffer chains (their nodes come from
// blocks kept per thread), drawing objects, LISP values, Qt objects tied to a thread, or
// anything counted without atomics.
#include <condition_variable>
#include <cstddef>
#include <mutex>
#include <new>
#include <thread>
#include <type_traits>
#include <utility>

class Descarte {
public:
    Descarte() = default;
    // Frees everything still handed over, then stops its thread.
    ~Descarte();
    Descarte(const Descarte&) = delete;
    Descarte& operator=(const Descarte&) = delete;

    // Moves `coisa` in and destroys it on the thread. False when there was no memory or no
    // thread for it: `coisa` is then left as it was, for the caller to free.
    template <class T>
    bool Entregar(T&& coisa) noexcept;
    // Hands `coisa` to the module's thread; without one, or when the hand-over fails, it is
    // freed here.
    template <class T>
    static void Descartar(T&& coisa) noexcept;
    // Empties `coisa` at once, and what it held goes as Descartar says.
    template <class T>
    static void Largar(T& coisa) noexcept;
    // Returns once everything handed over so far is destroyed.
    void Esperar();

    // The one the module's commands hand their frees to while the module is loaded; null
    // outside it (a test, another plug-in), and then they free in place.
    static Descarte* DoModulo();
    // Makes `descarte` the module's (null: none); a Descarte stops being it when destroyed.
    static void DefinirDoModulo(Descarte* descarte);

private:
    struct Tarefa {
        virtual ~Tarefa() = default;
        Tarefa* proxima = nullptr;
    };
    template <class T>
    struct Guardado final : Tarefa {
        explicit Guardado(T&& c) noexcept : coisa(std::move(c)) {}
        T coisa;
    };
    // Starts the thread when there is none yet; false when it cannot be started.
    bool Iniciar() noexcept;
    void Enfileirar(Tarefa* tarefa) noexcept;
    void Trabalhar();

    std::mutex mutex_;
    std::condition_variable temTrabalho_, esvaziou_;
    Tarefa* primeira_ = nullptr;
    Tarefa* ultima_ = nullptr;
    std::size_t pendentes_ = 0;  // handed over, not yet destroyed
    bool parar_ = false;
    std::thread thread_;  // started at the first hand-over
};

template <class T>
bool Descarte::Entregar(T&& coisa) noexcept {
    static_assert(!std::is_lvalue_reference_v<T>, "hand things over with std::move");
    static_assert(std::is_nothrow_move_constructible_v<T>);
    if (!Iniciar()) return false;
    auto* tarefa = new (std::nothrow) Guardado<T>(std::move(coisa));
    if (!tarefa) return false;
    Enfileirar(tarefa);
    return true;
}

template <class T>
void Descarte::Descartar(T&& coisa) noexcept {
    static_assert(!std::is_lvalue_reference_v<T>, "hand things over with std::move");
    T fora = std::move(coisa);
    if (Descarte* descarte = DoModulo()) descarte->Entregar(std::move(fora));
}

template <class T>
void Descarte::Largar(T& coisa) noexcept {
    Descartar(std::exchange(coisa, T()));
}
