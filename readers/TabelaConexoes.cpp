#include "TabelaConexoes.h"

#include "ZVString.h"
#include "host/sdk/LispInterface.h"

#include <algorithm>
#include <bit>

using zvsdk::ResultBuffer;

namespace {

bool Ascii(std::string_view texto) {
    return std::all_of(texto.begin(), texto.end(),
                       [](char c) { return static_cast<unsigned char>(c) < 0x80; });
}

bool EhFimDeFio(const ResultBuffer* no) {
    return no->restype == zvsdk::RTLE && no->rbnext && no->rbnext->restype == zvsdk::RTLE;
}

// ZVString::ParaHandle of the text, without a copy when it is plain hexadecimal digits.
std::uint64_t Handle(QStringView texto) {
    if (texto.size() > 0 && texto.size() <= 15) {
        std::uint64_t valor = 0;
        bool digitos = true;
        for (const QChar c : texto) {
            const char16_t u = c.unicode();
            const int digito = u >= '0' && u <= '9'   ? u - '0'
                               : u >= 'A' && u <= 'F' ? u - 'A' + 10
                               : u >= 'a' && u <= 'f' ? u - 'a' + 10
                                                      : -1;
            if (digito < 0) {
                digitos = false;
                break;
            }
            valor = valor << 4 | std::uint64_t(digito);
        }
        if (digitos) return valor;
    }
    return ZVString(texto.toString()).ParaHandle();
}

}  // namespace

// ---- Textos

QString TabelaConexoes::Textos::value(int i) const {
    if (i < 0 || i >= total_) return {};
    return tabela_->Feito(primeiro_ + std::size_t(i), inteiros_);
}

int TabelaConexoes::Textos::indexOf(QStringView texto) const {
    for (int i = 0; i < total_; ++i)
        if (Iguais(vista(i), texto)) return i;
    return -1;
}

QStringList TabelaConexoes::Textos::ParaLista() const {
    QStringList lista;
    lista.reserve(total_);
    for (int i = 0; i < total_; ++i)
        lista << value(i);
    return lista;
}

// ---- the table

QString TabelaConexoes::Feito(std::size_t k, bool inteiro) const {
    const Texto& texto = textos_[k];
    // an element that is its whole text is the whole text's QString
    const bool todo = inteiro || texto.corte == texto.tamanho;
    std::vector<QString>& feitos = todo ? inteirosFeitos_ : partesFeitos_;
    if (feitos.size() < textos_.size()) feitos.resize(textos_.size());
    if (feitos[k].isNull())
        feitos[k] = QString(reinterpret_cast<const QChar*>(texto.inicio),
                            todo ? texto.tamanho : texto.corte);
    return feitos[k];
}

char16_t* TabelaConexoes::Espaco(std::size_t unidades) {
    if (blocos_.empty() || blocos_.back().tamanho - blocos_.back().usado < unidades) {
        // the blocks after the first double: a guess too small costs a few blocks
        const std::size_t tamanho = std::max({unidades, proximoBloco_, std::size_t(4096)});
        blocos_.push_back({std::make_unique_for_overwrite<char16_t[]>(tamanho), 0, tamanho});
        proximoBloco_ = tamanho * 2;
    }
    Bloco& bloco = blocos_.back();
    char16_t* espaco = bloco.dados.get() + bloco.usado;
    bloco.usado += unidades;
    return espaco;
}

QStringView TabelaConexoes::Guarda(QStringView texto) {
    char16_t* destino = Espaco(std::size_t(texto.size()));
    std::copy(texto.utf16(), texto.utf16() + texto.size(), destino);
    return {destino, texto.size()};
}

QStringView TabelaConexoes::Guarda(std::string_view utf8) {
    if (!Ascii(utf8)) return Guarda(QString::fromUtf8(utf8.data(), int(utf8.size())));
    char16_t* destino = Espaco(utf8.size());
    std::copy(utf8.begin(), utf8.end(), destino);
    return {destino, qsizetype(utf8.size())};
}

void TabelaConexoes::Reserva(std::size_t fios) {
    const std::size_t tamanho = std::bit_ceil(std::max<std::size_t>(16, fios * 2));
    if (tamanho <= indice_.size()) return;
    indice_.assign(tamanho, Vaga{});
    for (std::uint32_t lugar = 0; lugar < fios_.size(); ++lugar)
        Indexa(lugar);
}

// FNV-1a over the code units.
std::uint32_t TabelaConexoes::HashDe(QStringView numero) {
    std::uint32_t hash = 2166136261u;
    for (const QChar c : numero)
        hash = (hash ^ c.unicode()) * 16777619u;
    return hash;
}

// Wire numbers are alike ("101", "102"...) and so are the low bits of their hashes: the slot
// is taken from the high bits of a product.
std::size_t TabelaConexoes::Espalha(std::uint32_t hash, std::size_t mascara) {
    return std::size_t((std::uint64_t(hash) * 0x9E3779B97F4A7C15ull) >> 32) & mascara;
}

// The record takes the slot of its number, or a free one.
void TabelaConexoes::Indexa(std::uint32_t lugar) {
    const std::size_t mascara = indice_.size() - 1;
    const QStringView numero = fios_[lugar].Numero();
    const std::uint32_t hash = HashDe(numero);
    for (std::size_t slot = Espalha(hash, mascara);; slot = (slot + 1) & mascara) {
        Vaga& vaga = indice_[slot];
        if (vaga.lugar == 0 ||
            (vaga.hash == hash && Iguais(fios_[vaga.lugar - 1].Numero(), numero))) {
            vaga = {hash, lugar + 1};
            return;
        }
    }
}

const TabelaConexoes::Fio* TabelaConexoes::Procura(QStringView numero) const {
    Completa();
    if (indice_.empty()) return nullptr;
    const std::size_t mascara = indice_.size() - 1;
    const std::uint32_t hash = HashDe(numero);
    for (std::size_t slot = Espalha(hash, mascara);; slot = (slot + 1) & mascara) {
        const Vaga& vaga = indice_[slot];
        if (vaga.lugar == 0) return nullptr;
        if (vaga.hash == hash && Iguais(fios_[vaga.lugar - 1].Numero(), numero))
            return &fios_[vaga.lugar - 1];
    }
}

void TabelaConexoes::ReservaResposta(std::size_t fios, std::size_t entradas, std::size_t unidades) {
    fios_.reserve(fios_.size() + fios);
    Reserva(fios_.size() + fios);
    textos_.reserve(textos_.size() + entradas);
    pontos_.reserve(pontos_.size() + entradas);
    handles_.reserve(handles_.size() + entradas);
    // the answer's texts in one block when the guess holds; room not used is never touched
    if (blocos_.empty() || blocos_.back().tamanho - blocos_.back().usado < unidades)
        proximoBloco_ = std::max(proximoBloco_, unidades);
}

TabelaConexoes::Fio TabelaConexoes::AbreFio(QStringView numero, bool detalhes) const {
    Fio fio;
    fio.numero = numero.utf16();
    fio.tamanhoNumero = std::uint32_t(numero.size());
    fio.primeiro = std::uint32_t(textos_.size());
    fio.inteiros = !detalhes;
    if (!detalhes) {
        // a wire of the same number keeps its whole texts; nothing else of it is kept
        if (const Fio* antes = Procura(numero)) {
            fio.primeiraCompleta = antes->primeiraCompleta;
            fio.completas = antes->completas;
        }
    }
    return fio;
}

void TabelaConexoes::Entrada(QStringView texto, bool detalhes, bool completas) {
    const int corte = detalhes ? int(texto.indexOf(QLatin1Char('#'))) : -1;
    // Without the whole texts only the element is kept.
    const bool soElemento = detalhes && !completas && corte >= 0;
    const QStringView guardado = Guarda(soElemento ? texto.left(corte) : texto);
    const int elemento = corte < 0 || soElemento ? int(guardado.size()) : corte;
    Entrada(guardado, elemento, Handle(guardado.left(elemento)));
}

void TabelaConexoes::Entrada(QStringView texto, int corte, std::uint64_t handle) {
    textos_.push_back({texto.utf16(), std::int32_t(texto.size()), corte});
    handles_.push_back(handle);
    pontos_.push_back({});
}

void TabelaConexoes::EntradaDeSimbolo(std::uint64_t handle, int digitos, bool inteiro,
                                      std::string_view conexao, std::string_view bloco) {
    const std::size_t tamanho =
        std::size_t(digitos) + (inteiro ? 2 + conexao.size() + bloco.size() : 0);
    char16_t* const inicio = Espaco(tamanho);
    std::uint64_t resto = handle;
    for (int i = digitos - 1; i >= 0; --i, resto >>= 4)
        inicio[i] = char16_t("0123456789ABCDEF"[resto & 0xF]);
    if (inteiro) {
        char16_t* fim = inicio + digitos;
        *fim++ = u'#';
        fim = std::copy(conexao.begin(), conexao.end(), fim);
        *fim++ = u'#';
        std::copy(bloco.begin(), bloco.end(), fim);
    }
    Entrada(QStringView(inicio, qsizetype(tamanho)), digitos, handle);
}

void TabelaConexoes::FechaFio(Fio&& fio, bool detalhes, bool completas) {
    fio.total = std::uint32_t(textos_.size()) - fio.primeiro;
    if (detalhes && completas) {
        fio.primeiraCompleta = fio.primeiro;
        fio.completas = fio.total;
    }
    fios_.push_back(std::move(fio));
    Indexa(std::uint32_t(fios_.size() - 1));
}

void TabelaConexoes::Carrega(const ResultBuffer* resposta, bool detalhes, bool completas) {
    const ResultBuffer* no = resposta && resposta->restype != zvsdk::RTNIL ? resposta : nullptr;
    // the wires (the lists one level down) and the texts counted first: each array grows once
    std::size_t fios = 0, entradas = 0, unidades = 0;
    int nivel = 0;
    for (const ResultBuffer* p = no; p; p = p->rbnext) {
        if (p->restype == zvsdk::RTLB && nivel++ == 1) ++fios;
        if (p->restype == zvsdk::RTLE) --nivel;
        if (p->restype != zvsdk::RTSTR) continue;
        ++entradas;
        unidades += std::size_t(p->rstring.size());
    }
    ReservaResposta(fios, entradas, unidades);
    for (; no; no = no ? no->rbnext : nullptr) {
        if (no->restype == zvsdk::RTLB || no->restype == zvsdk::RTLE) continue;
        Fio fio = AbreFio(Guarda(no->restype == zvsdk::RTSTR ? no->rstring : QString()), detalhes);
        // a number closed at once: a wire without entries
        if (no->rbnext && no->rbnext->restype == zvsdk::RTLE) {
            FechaFio(std::move(fio), detalhes, completas);
            no = no->rbnext;
            continue;
        }
        int coordenada = 0;
        for (no = no->rbnext; no && !EhFimDeFio(no); no = no->rbnext) {
            if (no->restype == zvsdk::RTSTR) {
                Entrada(no->rstring, detalhes, completas);
                coordenada = 0;
            } else if (no->restype == zvsdk::RTREAL && textos_.size() > fio.primeiro &&
                       coordenada < 3) {
                CEPonto& p = pontos_.back();
                (coordenada == 0 ? p.x : coordenada == 1 ? p.y : p.z) = no->rreal;
                ++coordenada;
            }
        }
        FechaFio(std::move(fio), detalhes, completas);
    }
}

// Takes the host's answer value by value, as Carrega reads its chain.
class TabelaConexoes::Receptor final : public zvsdk::ConnectionReceiver {
public:
    Receptor(TabelaConexoes& tabela, bool detalhes, bool completas)
        : tabela_(tabela), detalhes_(detalhes), completas_(completas) {}
    void begin(std::size_t fios, std::size_t entradas) override {
        // a number and a handle take a few units; a whole text about a few dozen
        const std::size_t porEntrada = detalhes_ && completas_ ? 32 : 6;
        tabela_.ReservaResposta(fios, entradas, fios * 6 + entradas * porEntrada);
    }
    void wire(QString numero) override { Abre(tabela_.Guarda(numero)); }
    void wireNumber(std::string_view numero) override { Abre(tabela_.Guarda(numero)); }
    void entry(QString texto, double x, double y, double z) override {
        if (!aberto_) return;
        tabela_.Entrada(texto, detalhes_, completas_);
        tabela_.pontos_.back() = {x, y, z};
    }
    // The element of a symbol's entry is its handle's text: it is written alone when the
    // whole text is not kept, and nothing is read back from the text. A text whose element is
    // the whole of it, or a handle longer than Handle reads as a number, goes the way of
    // entry(); names that are not ASCII are decoded as symbolEntryText decodes them.
    void symbolEntry(std::uint64_t handle, bool details, std::string_view connection,
                     std::string_view block, double x, double y, double z) override {
        int digitos = 1;
        for (std::uint64_t resto = handle >> 4; resto != 0; resto >>= 4)
            ++digitos;
        if (!aberto_ || (details && !detalhes_) || digitos > 15) {
            ConnectionReceiver::symbolEntry(handle, details, connection, block, x, y, z);
            return;
        }
        const bool inteiro = details && completas_;
        if (inteiro && !(Ascii(connection) && Ascii(block))) {
            const QString texto = zvsdk::symbolEntryText(handle, true, connection, block);
            tabela_.Entrada(tabela_.Guarda(texto), digitos, handle);
        } else {
            tabela_.EntradaDeSimbolo(handle, digitos, inteiro, connection, block);
        }
        tabela_.pontos_.back() = {x, y, z};
    }
    void Fecha() {
        if (aberto_) tabela_.FechaFio(std::move(fio_), detalhes_, completas_);
        aberto_ = false;
    }

private:
    void Abre(QStringView numero) {
        Fecha();
        fio_ = tabela_.AbreFio(numero, detalhes_);
        aberto_ = true;
    }
    TabelaConexoes& tabela_;
    const bool detalhes_, completas_;
    Fio fio_;
    bool aberto_ = false;
};

bool TabelaConexoes::CarregaSemCadeia(const QString& funcao, bool detalhes, bool completas) {
    Receptor receptor(*this, detalhes, completas);
    if (!CICad::zvInvokeConexoes(funcao, receptor)) return false;
    receptor.Fecha();
    return true;
}

void TabelaConexoes::CarregaDe(const QString& funcao, bool detalhes, bool completas) {
    if (CarregaSemCadeia(funcao, detalhes, completas)) return;
    zvsdk::ResultBuffer* resposta = CICad::zvInvokeLista(funcao);
    Carrega(resposta, detalhes, completas);
    CICad::LiberaLista(resposta);
}

bool TabelaConexoes::Adia(const QString& funcao, bool detalhes, bool completas) {
    if (CICad::zvPreparaConexoes(funcao)) {
        adiadas_.push_back({funcao, detalhes, completas});
        return true;
    }
    // The answers add up in the order they were asked: what was put off comes first.
    Completa();
    return false;
}

void TabelaConexoes::CarregaAdiadas() {
    // Taken out first: loading looks the table up.
    const std::vector<Adiada> adiadas = std::move(adiadas_);
    adiadas_.clear();
    for (const Adiada& a : adiadas)
        CarregaDe(a.funcao, a.detalhes, a.completas);
}

std::optional<TabelaConexoes::Textos> TabelaConexoes::Elementos(const QString& fio) const {
    const Fio* f = Procura(fio);
    if (!f) return std::nullopt;
    return Textos(this, f->primeiro, int(f->total), f->inteiros);
}

std::optional<TabelaConexoes::Textos> TabelaConexoes::Completas(const QString& fio) const {
    const Fio* f = Procura(fio);
    if (!f) return std::nullopt;
    return Textos(this, f->primeiraCompleta, int(f->completas), true);
}

std::optional<std::span<const CEPonto>> TabelaConexoes::Pontos(const QString& fio) const {
    const Fio* f = Procura(fio);
    if (!f) return std::nullopt;
    return std::span<const CEPonto>(pontos_.data() + f->primeiro, f->total);
}

std::optional<TabelaConexoes::Entradas> TabelaConexoes::DoFio(const QString& fio) const {
    const Fio* f = Procura(fio);
    if (!f) return std::nullopt;
    return Entradas{Textos(this, f->primeiro, int(f->total), f->inteiros),
                    Textos(this, f->primeiraCompleta, int(f->completas), true),
                    {pontos_.data() + f->primeiro, f->total},
                    {handles_.data() + f->primeiro, f->total}};
}
