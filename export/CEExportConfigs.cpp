#include "CEExportConfigs.h"

#include "host/sdk/AtomicFile.h"
#include "readers/ZVString.h"

#include <QFile>
#include <QFileInfo>

#include <algorithm>
#include <filesystem>

namespace {

enum class Tipo { Config, Valor, Secao, Coluna, Filtro, Opcao };

struct Linha {
    Tipo tipo = Tipo::Opcao;
    QString nome;  // configuration or section name, or key
    QString valor;
    CEExportSecao::LinhaColuna coluna;
    CEExportSecao::LinhaFiltro filtro;
};

QString Campo(const QStringList& campos, int indice) {
    return indice < campos.size() ? campos[indice] : QString();
}

bool Sim(const QString& texto) {
    return texto == QLatin1String("S");
}

QString SN(bool valor) {
    return valor ? QStringLiteral("S") : QStringLiteral("N");
}

QString Desescapa(QString texto, QChar separador) {
    return texto.replace(QLatin1String(CEExportConfigs::kEscape), QString(separador));
}

QString Escapa(QString texto, QChar separador) {
    return texto.replace(separador, QLatin1String(CEExportConfigs::kEscape));
}

// "KEY=VALUE": each part trimmed; the value ends at the next "=".
void ChaveValor(const QString& texto, QString& chave, QString& valor) {
    const QStringList partes = ZVString(texto).Divide("=");
    chave = Campo(partes, 0).trimmed();
    valor = Campo(partes, 1).trimmed();
}

Linha Analisa(const QString& bruta) {
    const QString texto = bruta.trimmed();
    Linha linha;
    const QChar primeiro = texto.at(0);
    if (primeiro == '{' || primeiro == '[') {
        linha.tipo = primeiro == '{' ? Tipo::Config : Tipo::Secao;
        linha.nome = texto.mid(1, std::max(0, int(texto.size()) - 2));
    } else if (primeiro == '-') {
        linha.tipo = Tipo::Valor;
        ChaveValor(texto.mid(1), linha.nome, linha.valor);
    } else if (primeiro == '*') {
        linha.tipo = Tipo::Coluna;
        const QStringList c = ZVString(texto).Divide("*");
        auto& coluna = linha.coluna;
        coluna.Tag = Campo(c, 0);
        coluna.Visivel = Sim(Campo(c, 1));
        coluna.Agrupa = Sim(Campo(c, 2));
        coluna.Titulo = Desescapa(Campo(c, 3), '*');
        coluna.Literal = Sim(Campo(c, 4));
        coluna.Concatena = Sim(Campo(c, 5));
        coluna.Direita = Sim(Campo(c, 6));
        // Width and fill keep the escape as it stands: they have always been read so.
        coluna.Tamanho = Campo(c, 7);
        coluna.Preenche = Campo(c, 8);
    } else if (primeiro == '#') {
        linha.tipo = Tipo::Filtro;
        const QStringList c = ZVString(texto).Divide("#");
        linha.filtro.Campo = Desescapa(Campo(c, 0), '#');
        linha.filtro.Operador = ZVString(Campo(c, 1)).ParaInteiro();
        linha.filtro.Valor = Desescapa(Campo(c, 2), '#');
    } else {
        linha.tipo = Tipo::Opcao;
        ChaveValor(texto, linha.nome, linha.valor);
    }
    return linha;
}

QString TextoColuna(const CEExportSecao::LinhaColuna& c) {
    // The tag is written as it is: a "*" in it has never been escaped.
    const QStringList campos = {c.Tag,
                                SN(c.Visivel),
                                SN(c.Agrupa),
                                Escapa(c.Titulo, '*'),
                                SN(c.Literal),
                                SN(c.Concatena),
                                SN(c.Direita),
                                Escapa(c.Tamanho, '*'),
                                Escapa(c.Preenche, '*')};
    return "*" + campos.join('*');
}

QString TextoFiltro(const CEExportSecao::LinhaFiltro& f) {
    return "#" + Escapa(f.Campo, '#') + "#" + QString::number(f.Operador) + "#" +
           Escapa(f.Valor, '#');
}

bool Existe(const QString& caminho) {
    return QFileInfo(caminho).isFile();
}

}  // namespace

CEExportConfigs& CEExportConfigs::Global() {
    static CEExportConfigs configs;
    return configs;
}

bool CEExportConfigs::LeTexto(const QByteArray& bytes) {
    std::vector<Linha> linhas;
    int inicio = 0;
    while (inicio < bytes.size()) {
        int fim = bytes.indexOf('\n', inicio);
        if (fim < 0) fim = bytes.size();
        int tamanho = fim - inicio;
        if (tamanho > 0 && bytes[inicio + tamanho - 1] == '\r') --tamanho;
        if (tamanho > kMaxLinha) return false;
        const QString texto = QString::fromLatin1(bytes.constData() + inicio, tamanho);
        if (!texto.trimmed().isEmpty()) linhas.push_back(Analisa(texto));
        inicio = fim + 1;
    }

    Configs.clear();
    for (Linha& linha : linhas) {
        if (linha.tipo == Tipo::Config) {
            Configs.push_back(std::make_unique<CEExportConfig>(linha.nome));
            continue;
        }
        if (Configs.empty()) Configs.push_back(std::make_unique<CEExportConfig>());
        CEExportConfig& config = *Configs.back();
        if (linha.tipo == Tipo::Valor) {
            config.Valores.definir(linha.nome, linha.valor);
            continue;
        }
        if (linha.tipo == Tipo::Secao) {
            config.NovaSecao(linha.nome);
            continue;
        }
        // Rows and options before the first section of their configuration have no place.
        if (config.Secoes.empty()) continue;
        CEExportSecao& secao = *config.Secoes.back();
        if (linha.tipo == Tipo::Opcao)
            secao.Opcoes.definir(linha.nome, linha.valor);
        else if (linha.tipo == Tipo::Coluna)
            secao.Colunas.push_back(std::move(linha.coluna));
        else
            secao.Filtros.push_back(std::move(linha.filtro));
    }
    return true;
}

QByteArray CEExportConfigs::Texto() const {
    QString texto;
    const auto linha = [&texto](const QString& t) { texto += t + "\r\n"; };
    for (const auto& config : Configs) {
        linha("{" + config->Nome + "}");
        for (const auto& [chave, valor] : config->Valores)
            linha("-" + chave + "=" + valor);
        for (const auto& secao : config->Secoes) {
            linha("[" + secao->Nome + "]");
            for (const auto& [chave, valor] : secao->Opcoes)
                linha(chave + "=" + valor);
            for (const auto& coluna : secao->Colunas)
                linha(TextoColuna(coluna));
            for (const auto& filtro : secao->Filtros)
                linha(TextoFiltro(filtro));
        }
        linha(QString());
    }
    // One byte a character; what Latin-1 can't hold becomes "?".
    return texto.toLatin1();
}

QString CEExportConfigs::Caminho(const QString& pasta, const QString& arquivo) {
    if (QFileInfo(arquivo).isAbsolute()) return arquivo;
    const bool drive = pasta.size() == 2 && pasta.at(1) == ':';
    if (pasta.endsWith('/') || pasta.endsWith('\\') || drive) return pasta + arquivo;
    return pasta + "/" + arquivo;
}

void CEExportConfigs::CarregaDe(const QString& pasta) {
    const QString novo = Caminho(pasta, kArquivo);
    const QString antigo = Caminho(pasta, kArquivoAntigo);
    if (!Existe(novo) && !Existe(antigo)) return;
    QFile arquivo(Existe(novo) ? novo : antigo);
    if (!arquivo.open(QIODevice::ReadOnly)) return;
    const QByteArray bytes = arquivo.readAll();
    arquivo.close();
    // The older file is taken over under the new name through the one checked save.
    if (!Existe(novo)) {
        zvsdk::AtomicFile copia(novo);
        if (copia.open() && copia.write(bytes)) copia.commit();
    }
    if (LeTexto(bytes)) return;
    // Damaged. Copying the older file without leave to overwrite fails on purpose: the
    // error reaches the caller and the damaged file stays for the user to look at.
    if (Existe(antigo))
        std::filesystem::copy_file(std::filesystem::path(QFile::encodeName(antigo).toStdString()),
                                   std::filesystem::path(QFile::encodeName(novo).toStdString()));
}

int CEExportConfigs::LinhaMaisLonga(const QByteArray& texto) {
    int maior = 0;
    int inicio = 0;
    while (inicio < texto.size()) {
        int fim = texto.indexOf('\n', inicio);
        if (fim < 0) fim = texto.size();
        int tamanho = fim - inicio;
        if (tamanho > 0 && texto[inicio + tamanho - 1] == '\r') --tamanho;
        maior = std::max(maior, tamanho);
        inicio = fim + 1;
    }
    return maior;
}

bool CEExportConfigs::SalvaEm(const QString& pasta, QString* erro) const {
    const QByteArray bytes = Texto();
    const QString caminho = Caminho(pasta, kArquivo);
    // Escapes and written-out flags make a line longer than it was read; one past the
    // limit would make the whole file read as damaged next time.
    if (LinhaMaisLonga(bytes) > kMaxLinha) {
        if (erro)
            *erro = QStringLiteral("could not save %1: a line would be longer than %2 characters")
                        .arg(caminho)
                        .arg(kMaxLinha);
        return false;
    }
    return zvsdk::saveFileAtomically(
        caminho, std::string_view(bytes.constData(), size_t(bytes.size())), erro);
}

CEExportConfig* CEExportConfigs::Config(const QString& nome) const {
    for (const auto& config : Configs)
        if (config->Nome == nome) return config.get();
    return nullptr;
}

CEExportSecao& CEExportConfigs::ObtemSecao(const QString& config, const QString& secao) {
    CEExportConfig* c = Config(config);
    if (!c) {
        Configs.push_back(std::make_unique<CEExportConfig>(config));
        c = Configs.back().get();
    }
    if (CEExportSecao* s = c->Secao(secao)) return *s;
    return c->NovaSecao(secao);
}

QString CEExportConfigs::ObtemConfigAtiva() const {
    const CEExportConfig* semNome = Config(QString());
    return semNome ? semNome->Valores.valor("CFG_ATIVO") : QString();
}

void CEExportConfigs::DefineConfigAtiva(const QString& nome) {
    if (CEExportConfig* semNome = Config(QString())) semNome->Valores.definir("CFG_ATIVO", nome);
}

void CEExportConfigs::RemoveConfig(const QString& nome) {
    if (!nome.isEmpty())
        Configs.erase(std::remove_if(Configs.begin(), Configs.end(),
                                     [&nome](const auto& c) { return c->Nome == nome; }),
                      Configs.end());
    DefineConfigAtiva(QString());
}
