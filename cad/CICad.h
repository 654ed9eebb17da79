#pragma once
// The facade: everything the list logic needs of the host, as operations without state.
// Each works on the active document, or on the database handed in.
#include "host/sdk/ResultBuffer.h"

#include <QString>
#include <QStringList>

namespace zvsdk {
class Document;
}

class CICad {
public:
    // ---- command line, messages and log
    // Prints text on the active document's command line, exactly as given.
    static void Imprime(const QString& texto);
    // "\n", message `numero` of section ZVLISTAS, "\n".
    static void ImprimeMensagem(int numero);
    // Appends a dated line with the process id to "LogFile.txt".
    static void Log(const QString& linha);
    static QString ArquivoLog();

    // ---- reading LISP symbols
    // The symbol's raw chain (the caller frees it with LiberaLista); null when missing.
    static zvsdk::ResultBuffer* LeSimboloLisp(const QString& nome);
    static QString GetStringLisp(const QString& nome, const QString& padrao = QString());
    static double GetRealLisp(const QString& nome, double padrao = 0.0);
    static int GetIntLisp(const QString& nome, int padrao = 0);
    static bool GetBoolLisp(const QString& nome, zvsdk::Document* documento);
    static bool GetBoolLisp(const QString& nome);
    static QStringList GetListaLisp(const QString& nome);

    // ---- writing LISP symbols
    static void SetStringLisp(const QString& nome, const QString& texto,
                              zvsdk::Document* documento = nullptr);
    static void SetNilLisp(const QString& nome, zvsdk::Document* documento = nullptr);
    static void SetIntLisp(const QString& nome, int valor);
    static void SetRealLisp(const QString& nome, double valor);
    static void SetListaLisp(const QString& nome, const QStringList& lista);
    // Sets a symbol to a chain the caller built; the caller keeps the chain.
    static void SetChainLisp(const QString& nome, const zvsdk::ResultBuffer* chain);

    // ---- calling LISP functions with text arguments (at most nine)
    static void zvInvokeVoid(const QString& funcao, const QStringList& args = {});
    // The raw result chain; the caller frees it with LiberaLista.
    static zvsdk::ResultBuffer* zvInvokeLista(const QString& funcao, const QStringList& args = {});
    static int zvInvokeInt(const QString& funcao, const QStringList& args = {});
    static bool zvInvokeBool(const QString& funcao, const QStringList& args = {});
    static QString zvInvokeString(const QString& funcao, const QStringList& args = {});
    // Calls with a chain built by hand (function name first); the caller frees the result.
    static zvsdk::ResultBuffer* InvokeChain(const zvsdk::ResultBuffer* chamada);
    static void LiberaLista(zvsdk::ResultBuffer* lista);

    // ---- evaluating LISP text
    static bool AvaliaLisp(const QString& texto);

    // ---- result-list helpers, by position from 0
    static const zvsdk::ResultBuffer* NoDaLista(const zvsdk::ResultBuffer* lista, int posicao);
    static QString StringDaLista(const zvsdk::ResultBuffer* lista, int posicao);
    static int IntDaLista(const zvsdk::ResultBuffer* lista, int posicao);
    static double RealDaLista(const zvsdk::ResultBuffer* lista, int posicao);
    // The point at position 1 when that node is a point.
    static bool PontoDaLista(const zvsdk::ResultBuffer* lista, double* x, double* y, double* z);
    // Do the first nodes have these types? One to five codes.
    static bool PadraoDaLista(const zvsdk::ResultBuffer* lista, std::initializer_list<short> tipos);

    // ---- file dialogs: filter in "Desc|*.ext|Desc|*.ext" form; "" when cancelled.
    // `nome` says what is asked, for hosts that answer from a script.
    static QString DialogoArquivo(bool abrir, const QString& filtro, const QString& caminho,
                                  const QString& titulo, const QString& nome = "file");
    static QString ConverteFiltro(const QString& filtro);
    static void MessageBox(const QString& texto, const QString& titulo = QString());
};
