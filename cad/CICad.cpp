#include "CICad.h"

#include "host/sdk/Document.h"
#include "host/sdk/LispInterface.h"
#include "host/sdk/SystemServices.h"
#include "host/sdk/UserInterface.h"
#include "readers/ZVString.h"
#include "settings/CIMensagens.h"
#include "settings/CIRegistro.h"

#include <QDateTime>
#include <QFile>

#include <unistd.h>

using zvsdk::ResultBuffer;

namespace {

zvsdk::LispInterface* LispDe(zvsdk::Document* documento) {
    if (!documento) documento = zvsdk::activeDocument();
    return documento ? documento->lisp() : nullptr;
}

// The symbol's chain, or null when it is missing or the read failed.
ResultBuffer* LeSimbolo(const QString& nome, zvsdk::Document* documento = nullptr) {
    zvsdk::LispInterface* lisp = LispDe(documento);
    if (!lisp) return nullptr;
    ResultBuffer* valor = nullptr;
    if (lisp->lispGetSymbol(nome, &valor) != zvsdk::RTNORM) {
        zvsdk::releaseChain(valor);
        return nullptr;
    }
    return valor;
}

// The first node of the symbol's value, without the chain; false when it is unbound.
bool LePrimeiro(const QString& nome, ResultBuffer& primeiro, zvsdk::Document* documento = nullptr) {
    zvsdk::LispInterface* lisp = LispDe(documento);
    return lisp && lisp->lispGetSymbolFirst(nome, primeiro) == zvsdk::RTNORM;
}

void GravaSimbolo(const QString& nome, const ResultBuffer* valor,
                  zvsdk::Document* documento = nullptr) {
    if (zvsdk::LispInterface* lisp = LispDe(documento)) lisp->lispPutSymbol(nome, valor);
}

ResultBuffer* Chamada(const QString& funcao, const QStringList& args) {
    ResultBuffer* cabeca = zvsdk::newString(funcao);
    ResultBuffer* cauda = cabeca;
    for (const QString& arg : args.mid(0, 9))
        cauda = cauda->rbnext = zvsdk::newString(arg);
    return cabeca;
}

}  // namespace

void CICad::Imprime(const QString& texto) {
    if (zvsdk::Document* documento = zvsdk::activeDocument()) documento->printMessage(texto);
}

void CICad::ImprimeMensagem(int numero) {
    Imprime("\n" + CIMensagens::Mensagem("ZVLISTAS", numero) + "\n");
}

QString CICad::ArquivoLog() {
    QString pasta = CIRegistro::PastaTemporaria();
    if (!pasta.isEmpty() && !pasta.endsWith('/') && !pasta.endsWith('\\')) pasta += '/';
    return pasta + "LogFile.txt";
}

void CICad::Log(const QString& linha) {
    // Opened, written, flushed and closed for every line, so none is lost if the host dies.
    QFile arquivo(ArquivoLog());
    if (!arquivo.open(QIODevice::Append | QIODevice::Text)) return;
    const QDateTime agora = QDateTime::currentDateTime();
    const QString texto = ZVString::Data(agora.date()) + " " + ZVString::Hora(agora.time()) +
                          " - PID" + QString::number(getpid()) + " - " + linha + "\n";
    arquivo.write(texto.toUtf8());
    arquivo.flush();
}

ResultBuffer* CICad::LeSimboloLisp(const QString& nome) {
    return LeSimbolo(nome);
}

short CICad::TipoSimboloLisp(const QString& nome) {
    ResultBuffer valor;
    return LePrimeiro(nome, valor) ? valor.restype : short(zvsdk::RTNONE);
}

QString CICad::GetStringLisp(const QString& nome, const QString& padrao) {
    ResultBuffer valor;
    if (!LePrimeiro(nome, valor)) return padrao;
    // Any other type, nil included, reads as empty: callers test for emptiness.
    return valor.restype == zvsdk::RTSTR ? valor.rstring : QString();
}

double CICad::GetRealLisp(const QString& nome, double padrao) {
    ResultBuffer valor;
    if (!LePrimeiro(nome, valor)) return padrao;
    if (valor.restype == zvsdk::RTREAL) return valor.rreal;
    if (valor.restype == zvsdk::RTSHORT) return valor.rint;
    return padrao;
}

int CICad::GetIntLisp(const QString& nome, int padrao) {
    ResultBuffer valor;
    // Only 16-bit integers count; a 32-bit value gives the default.
    return LePrimeiro(nome, valor) && valor.restype == zvsdk::RTSHORT ? valor.rint : padrao;
}

bool CICad::GetBoolLisp(const QString& nome, zvsdk::Document* documento) {
    if (!documento) return false;
    ResultBuffer valor;
    return LePrimeiro(nome, valor, documento) && valor.restype != zvsdk::RTNIL;
}

bool CICad::GetBoolLisp(const QString& nome) {
    return GetBoolLisp(nome, zvsdk::activeDocument());
}

QStringList CICad::GetListaLisp(const QString& nome) {
    ResultBuffer* valor = LeSimbolo(nome);
    QStringList lista;
    for (const ResultBuffer* no = valor; no; no = no->rbnext)
        if (no->restype == zvsdk::RTSTR) lista << no->rstring;
    zvsdk::releaseChain(valor);
    return lista;
}

void CICad::SetStringLisp(const QString& nome, const QString& texto, zvsdk::Document* documento) {
    ResultBuffer* valor = zvsdk::newString(texto);
    GravaSimbolo(nome, valor, documento);
    zvsdk::releaseChain(valor);
}

void CICad::SetNilLisp(const QString& nome, zvsdk::Document* documento) {
    ResultBuffer* valor = zvsdk::newNode(zvsdk::RTNIL);
    GravaSimbolo(nome, valor, documento);
    zvsdk::releaseChain(valor);
}

void CICad::SetIntLisp(const QString& nome, int valor) {
    ResultBuffer* no = zvsdk::newShort(static_cast<short>(valor));
    GravaSimbolo(nome, no);
    zvsdk::releaseChain(no);
}

void CICad::SetRealLisp(const QString& nome, double valor) {
    ResultBuffer* no = zvsdk::newReal(valor);
    GravaSimbolo(nome, no);
    zvsdk::releaseChain(no);
}

void CICad::SetListaLisp(const QString& nome, const QStringList& lista) {
    ResultBuffer* cabeca = zvsdk::newNode(zvsdk::RTLB);
    ResultBuffer* cauda = cabeca;
    for (const QString& texto : lista)
        cauda = cauda->rbnext = zvsdk::newString(texto);
    cauda->rbnext = zvsdk::newNode(zvsdk::RTLE);
    GravaSimbolo(nome, cabeca);
    zvsdk::releaseChain(cabeca);
}

void CICad::SetChainLisp(const QString& nome, const ResultBuffer* chain) {
    GravaSimbolo(nome, chain);
}

void CICad::SetParesLisp(const QString& nome, const std::vector<zvsdk::StringPair>& pares) {
    if (zvsdk::LispInterface* lisp = LispDe(nullptr))
        lisp->lispPutStringPairs(nome, pares.data(), int(pares.size()));
}

ResultBuffer* CICad::InvokeChain(const ResultBuffer* chamada) {
    zvsdk::LispInterface* lisp = LispDe(nullptr);
    return lisp ? lisp->lispInvoke(chamada) : nullptr;
}

void CICad::LiberaLista(ResultBuffer* lista) {
    zvsdk::releaseChain(lista);
}

ResultBuffer* CICad::zvInvokeLista(const QString& funcao, const QStringList& args) {
    if (!zvsdk::activeDocument()) return nullptr;
    ResultBuffer* chamada = Chamada(funcao, args);
    ResultBuffer* resultado = InvokeChain(chamada);
    zvsdk::releaseChain(chamada);
    return resultado;
}

bool CICad::zvInvokeConexoes(const QString& funcao, zvsdk::ConnectionReceiver& receptor) {
    zvsdk::LispInterface* lisp = LispDe(nullptr);
    return lisp && lisp->lispInvokeConnections(funcao, receptor) != zvsdk::RTNONE;
}

bool CICad::zvPreparaConexoes(const QString& funcao) {
    zvsdk::LispInterface* lisp = LispDe(nullptr);
    return lisp && lisp->lispPrepareConnections(funcao);
}

bool CICad::zvInvokePolilinhas(const QString& funcao, const QString& argumento,
                               zvsdk::PolylineReceiver& receptor) {
    zvsdk::LispInterface* lisp = LispDe(nullptr);
    return lisp && lisp->lispInvokePolylines(funcao, argumento, receptor) != zvsdk::RTNONE;
}

void CICad::zvInvokeVoid(const QString& funcao, const QStringList& args) {
    zvsdk::releaseChain(zvInvokeLista(funcao, args));
}

int CICad::zvInvokeInt(const QString& funcao, const QStringList& args) {
    ResultBuffer* resultado = zvInvokeLista(funcao, args);
    int valor = 0;
    if (resultado && resultado->restype == zvsdk::RTSHORT) valor = resultado->rint;
    if (resultado && resultado->restype == zvsdk::RTLONG) valor = resultado->rlong;
    zvsdk::releaseChain(resultado);
    return valor;
}

bool CICad::zvInvokeBool(const QString& funcao, const QStringList& args) {
    ResultBuffer* resultado = zvInvokeLista(funcao, args);
    const bool valor = resultado && resultado->restype != zvsdk::RTNIL;
    zvsdk::releaseChain(resultado);
    return valor;
}

QString CICad::zvInvokeString(const QString& funcao, const QStringList& args) {
    ResultBuffer* resultado = zvInvokeLista(funcao, args);
    const QString valor =
        resultado && resultado->restype == zvsdk::RTSTR ? resultado->rstring : QString();
    zvsdk::releaseChain(resultado);
    return valor;
}

bool CICad::AvaliaLisp(const QString& texto) {
    zvsdk::LispInterface* lisp = LispDe(nullptr);
    return lisp && lisp->lispEvaluate(texto);
}

const ResultBuffer* CICad::NoDaLista(const ResultBuffer* lista, int posicao) {
    for (; lista && posicao > 0; --posicao)
        lista = lista->rbnext;
    return posicao == 0 ? lista : nullptr;
}

QString CICad::StringDaLista(const ResultBuffer* lista, int posicao) {
    const ResultBuffer* no = NoDaLista(lista, posicao);
    return no ? no->rstring : QString();
}

int CICad::IntDaLista(const ResultBuffer* lista, int posicao) {
    const ResultBuffer* no = NoDaLista(lista, posicao);
    if (no && no->restype == zvsdk::RTLONG) return no->rlong;
    if (no && no->restype == zvsdk::RTSHORT) return no->rint;
    return 0;
}

double CICad::RealDaLista(const ResultBuffer* lista, int posicao) {
    const ResultBuffer* no = NoDaLista(lista, posicao);
    if (no && no->restype == zvsdk::RTREAL) return no->rreal;
    if (no && no->restype == zvsdk::RTLONG) return no->rlong;
    if (no && no->restype == zvsdk::RTSHORT) return no->rint;
    return 0.0;
}

bool CICad::PontoDaLista(const ResultBuffer* lista, double* x, double* y, double* z) {
    const ResultBuffer* no = NoDaLista(lista, 1);
    if (!no || (no->restype != zvsdk::RTPOINT && no->restype != zvsdk::RT3DPOINT)) return false;
    *x = no->rpoint[0];
    *y = no->rpoint[1];
    *z = no->rpoint[2];
    return true;
}

bool CICad::PadraoDaLista(const ResultBuffer* lista, std::initializer_list<short> tipos) {
    for (short tipo : tipos) {
        if (!lista || lista->restype != tipo) return false;
        lista = lista->rbnext;
    }
    return true;
}

QString CICad::ConverteFiltro(const QString& filtro) {
    const QStringList partes = filtro.split('|');
    QString resultado;
    for (int i = 0; i + 1 < partes.size(); i += 2) {
        const QString& descricao = partes[i];
        if (descricao.contains('(') && descricao.contains(')'))
            resultado += descricao + ";;";
        else
            resultado += descricao + "( " + partes[i + 1] + " );;";
    }
    return resultado;
}

QString CICad::DialogoArquivo(bool abrir, const QString& filtro, const QString& caminho,
                              const QString& titulo, const QString& nome) {
    Log(QString(abrir ? "OPEN" : "SAVE") + " file dialog, filter=" + filtro + ", path=" + caminho);
    zvsdk::SystemServices* servicos = zvsdk::systemServices();
    QString resultado;
    if (servicos && servicos->userInterface())
        resultado = servicos->userInterface()->fileDialog(nome, abrir, ConverteFiltro(filtro),
                                                          caminho, titulo);
    Log("File dialog result: " + resultado);
    resultado.replace('/', '\\');
    return resultado;
}

void CICad::MessageBox(const QString& texto, const QString& titulo) {
    zvsdk::SystemServices* servicos = zvsdk::systemServices();
    if (servicos && servicos->userInterface()) servicos->userInterface()->messageBox(texto, titulo);
}

// ---------------------------------------------------------------------------------------
// The drawing side of the facade lives in CICadPaginas.cpp (layers, pages, views, files),
// CICadBlocos.cpp, CICadAtributos.cpp, CICadEntidades.cpp (entities and extents) and
// CICadDadosEstendidos.cpp (extended data, masters, project settings).

namespace {

zvdb::Database* databaseOverride = nullptr;

}  // namespace

double CICad::Simples(double valor) {
    // Through memory: GCC 12 drops float round trips of vectorised pairs at -O2 and above.
    volatile float simples = static_cast<float>(valor);
    return simples;
}

zvdb::Database* CICad::GetDatabase() {
    if (databaseOverride) return databaseOverride;
    zvsdk::Document* documento = zvsdk::activeDocument();
    return documento ? documento->database() : nullptr;
}

void CICad::SetDatabaseOverride(zvdb::Database* database) {
    databaseOverride = database;
}
