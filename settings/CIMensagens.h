#pragma once
// The message files: every text a user reads comes by section and number from them.
#include <QString>

class CIMensagens {
public:
    // The text of a message; empty when the section's file has no such number.
    static QString Mensagem(const QString& secao, int numero);
    // The language number of the user interface (1 Portuguese, 2 English, 3 Spanish).
    static int IdiomaAtual();
    // Forgets the loaded tables (at unload, and for tests).
    static void Descarregar();
};
