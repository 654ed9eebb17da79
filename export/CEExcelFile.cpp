#include "CEExcelFile.h"

#include "host/sdk/AtomicFile.h"

#include <QFile>
#include <QFileInfo>

#include <zip.h>
#include <pugixml.hpp>

#include <algorithm>
#include <cstring>
#include <map>
#include <string>

namespace zv {

namespace {

// Parts larger than this are not read into memory: no real sheet comes near it.
constexpr zip_uint64_t kMaxParte = 512ull * 1024 * 1024;
// Entries get one fixed time, so the same export gives the same bytes.
constexpr time_t kHoraFixa = 315532800;  // 1980-01-01

const char* const kNsPrincipal = "http://schemas.openxmlformats.org/spreadsheetml/2006/main";

bool TextoInvalidoXml(char16_t c) {
    return (c < 0x20 && c != 0x09 && c != 0x0A && c != 0x0D) || c == 0xFFFE || c == 0xFFFF;
}

bool Hex(QChar c) {
    const char16_t u = c.unicode();
    return (u >= '0' && u <= '9') || (u >= 'a' && u <= 'f') || (u >= 'A' && u <= 'F');
}

QString Hex4(char16_t c) {
    return QStringLiteral("_x%1_").arg(int(c), 4, 16, QChar('0')).toUpper().replace("_X", "_x");
}

// Characters XML can't hold become "_xHHHH_", and a text that already has that shape keeps
// it by escaping its underscore, so a reader gets back exactly what was written.
QString CodificaOoxml(const QString& texto) {
    QString saida;
    saida.reserve(texto.size());
    for (int i = 0; i < texto.size(); ++i) {
        const char16_t c = texto[i].unicode();
        const bool par =
            QChar::isHighSurrogate(c) && i + 1 < texto.size() && texto[i + 1].isLowSurrogate();
        if (par) {
            saida += texto[i];
            saida += texto[++i];
            continue;
        }
        if (TextoInvalidoXml(c) || QChar::isSurrogate(c)) {
            saida += Hex4(c);
            continue;
        }
        if (c == '_' && i + 6 < texto.size() && texto[i + 1] == 'x' && Hex(texto[i + 2]) &&
            Hex(texto[i + 3]) && Hex(texto[i + 4]) && Hex(texto[i + 5]) && texto[i + 6] == '_') {
            saida += QLatin1String("_x005F_");
            continue;
        }
        saida += texto[i];
    }
    return saida;
}

bool Espacos(const QString& t) {
    return !t.isEmpty() && (t.front().isSpace() || t.back().isSpace() || t.contains('\n'));
}

void EscapaXml(std::string& saida, const QByteArray& utf8) {
    for (const char c : utf8) {
        switch (c) {
            case '&':
                saida += "&amp;";
                break;
            case '<':
                saida += "&lt;";
                break;
            case '>':
                saida += "&gt;";
                break;
            case '\r':
                saida += "&#13;";
                break;
            default:
                saida += c;
        }
    }
}

// Plain ASCII with nothing to escape goes into the sheet as it is.
bool TextoSimples(const QString& t) {
    for (const QChar ch : t) {
        const char16_t c = ch.unicode();
        if (c < 0x20 || c >= 0x7F || c == '&' || c == '<' || c == '>' || c == '_') return false;
    }
    return true;
}

bool PareceFormula(const QString& t) {
    if (t.isEmpty()) return false;
    const char16_t c = t.front().unicode();
    return c == '=' || c == '+' || c == '-' || c == '@';
}

// The name without its namespace prefix.
const char* Local(const char* nome) {
    const char* dois = std::strchr(nome, ':');
    return dois ? dois + 1 : nome;
}

std::string Prefixo(const pugi::xml_node& no) {
    const char* nome = no.name();
    const char* dois = std::strchr(nome, ':');
    return dois ? std::string(nome, size_t(dois - nome + 1)) : std::string();
}

pugi::xml_node Filho(const pugi::xml_node& pai, const char* local) {
    for (pugi::xml_node no : pai.children())
        if (no.type() == pugi::node_element && std::strcmp(Local(no.name()), local) == 0) return no;
    return {};
}

// "BC12" to zero-based column and row; false when it is no cell reference.
bool LeReferencia(const char* ref, int& linha, int& coluna) {
    int c = 0;
    const char* p = ref;
    while (*p >= 'A' && *p <= 'Z' && c <= CEExcelFile::kMaxColunas)
        c = c * 26 + (*p++ - 'A' + 1);
    long r = 0;
    const char* digitos = p;
    while (*p >= '0' && *p <= '9' && r <= CEExcelFile::kMaxLinhas)
        r = r * 10 + (*p++ - '0');
    if (*p != '\0' || p == digitos || c == 0 || r == 0) return false;
    linha = int(r) - 1;
    coluna = c - 1;
    return true;
}

struct Arquivo {
    zip_t* zip = nullptr;
    zip_source_t* fonte = nullptr;
    ~Arquivo() {
        if (zip) zip_discard(zip);
        if (fonte) zip_source_free(fonte);
    }
};

// Opens bytes as an archive that can be changed in memory.
bool AbreZip(Arquivo& a, const QByteArray& bytes, int flags) {
    zip_error_t erro;
    zip_error_init(&erro);
    a.fonte = zip_source_buffer_create(bytes.isEmpty() ? nullptr : bytes.constData(),
                                       zip_uint64_t(bytes.size()), 0, &erro);
    if (!a.fonte) return zip_error_fini(&erro), false;
    zip_source_keep(a.fonte);
    a.zip = zip_open_from_source(a.fonte, flags, &erro);
    zip_error_fini(&erro);
    return a.zip != nullptr;
}

// An entry's bytes; false when it is missing or too large.
bool LeEntrada(zip_t* zip, const std::string& nome, QByteArray& bytes) {
    zip_stat_t st;
    zip_stat_init(&st);
    if (zip_stat(zip, nome.c_str(), 0, &st) != 0 || !(st.valid & ZIP_STAT_SIZE) ||
        st.size > kMaxParte)
        return false;
    zip_file_t* f = zip_fopen(zip, nome.c_str(), 0);
    if (!f) return false;
    bytes.resize(int(st.size));
    const zip_int64_t lidos = zip_fread(f, bytes.data(), st.size);
    zip_fclose(f);
    return lidos == zip_int64_t(st.size);
}

// Adds or replaces an entry; the bytes must live until the archive is closed. Sheets are
// compressed at the fastest level: they are most of the work and shrink well anyway.
bool GravaEntrada(zip_t* zip, const std::string& nome, const QByteArray& bytes, int nivel = 6) {
    zip_source_t* fonte = zip_source_buffer(zip, bytes.constData(), zip_uint64_t(bytes.size()), 0);
    if (!fonte) return false;
    const zip_int64_t indice = zip_file_add(zip, nome.c_str(), fonte, ZIP_FL_OVERWRITE);
    if (indice < 0) return zip_source_free(fonte), false;
    zip_file_set_mtime(zip, zip_uint64_t(indice), kHoraFixa, 0);
    zip_set_file_compression(zip, zip_uint64_t(indice), ZIP_CM_DEFLATE, zip_uint32_t(nivel));
    return true;
}

// Closes the archive and gives the bytes it now holds.
bool FechaZip(Arquivo& a, QByteArray& saida) {
    if (zip_close(a.zip) != 0) return false;
    a.zip = nullptr;
    zip_stat_t st;
    zip_stat_init(&st);
    if (zip_source_stat(a.fonte, &st) != 0 || zip_source_open(a.fonte) != 0) return false;
    saida.resize(int(st.size));
    const zip_int64_t lidos = zip_source_read(a.fonte, saida.data(), st.size);
    zip_source_close(a.fonte);
    return lidos == zip_int64_t(st.size);
}

QByteArray Xml(const pugi::xml_document& doc) {
    struct Escritor : pugi::xml_writer {
        QByteArray bytes;
        void write(const void* dados, size_t tamanho) override {
            bytes.append(static_cast<const char*>(dados), int(tamanho));
        }
    } escritor;
    doc.save(escritor, "", pugi::format_raw, pugi::encoding_utf8);
    return escritor.bytes;
}

bool LeXml(const QByteArray& bytes, pugi::xml_document& doc) {
    return doc.load_buffer(bytes.constData(), size_t(bytes.size()), pugi::parse_full,
                           pugi::encoding_auto);
}

// A part name from a relationship's target, relative to the workbook's folder.
std::string ParteAlvo(const std::string& alvo) {
    if (!alvo.empty() && alvo.front() == '/') return alvo.substr(1);
    std::string caminho = "xl/" + alvo;
    for (size_t p; (p = caminho.find("/../")) != std::string::npos;) {
        const size_t antes = caminho.rfind('/', p == 0 ? 0 : p - 1);
        caminho.erase(antes == std::string::npos ? 0 : antes + 1,
                      p + 4 - (antes == std::string::npos ? 0 : antes + 1));
    }
    return caminho;
}

const char* const kTiposConteudo =
    "<?xml version=\"1.0\" encoding=\"UTF-8\" standalone=\"yes\"?>\n"
    "<Types xmlns=\"http://schemas.openxmlformats.org/package/2006/content-types\">"
    "<Default Extension=\"rels\" "
    "ContentType=\"application/vnd.openxmlformats-package.relationships+xml\"/>"
    "<Default Extension=\"xml\" ContentType=\"application/xml\"/>"
    "<Override PartName=\"/xl/workbook.xml\" "
    "ContentType=\"application/vnd.openxmlformats-officedocument.spreadsheetml.sheet.main+xml\"/>"
    "<Override PartName=\"/xl/worksheets/sheet1.xml\" "
    "ContentType=\"application/vnd.openxmlformats-officedocument.spreadsheetml.worksheet+xml\"/>"
    "<Override PartName=\"/xl/styles.xml\" "
    "ContentType=\"application/vnd.openxmlformats-officedocument.spreadsheetml.styles+xml\"/>"
    "</Types>";

const char* const kRelacoes =
    "<?xml version=\"1.0\" encoding=\"UTF-8\" standalone=\"yes\"?>\n"
    "<Relationships xmlns=\"http://schemas.openxmlformats.org/package/2006/relationships\">"
    "<Relationship Id=\"rId1\" "
    "Type=\"http://schemas.openxmlformats.org/officeDocument/2006/relationships/officeDocument\" "
    "Target=\"xl/workbook.xml\"/></Relationships>";

const char* const kPasta =
    "<?xml version=\"1.0\" encoding=\"UTF-8\" standalone=\"yes\"?>\n"
    "<workbook xmlns=\"http://schemas.openxmlformats.org/spreadsheetml/2006/main\" "
    "xmlns:r=\"http://schemas.openxmlformats.org/officeDocument/2006/relationships\">"
    "<sheets><sheet name=\"Planilha1\" sheetId=\"1\" r:id=\"rId1\"/></sheets></workbook>";

const char* const kRelacoesPasta =
    "<?xml version=\"1.0\" encoding=\"UTF-8\" standalone=\"yes\"?>\n"
    "<Relationships xmlns=\"http://schemas.openxmlformats.org/package/2006/relationships\">"
    "<Relationship Id=\"rId1\" "
    "Type=\"http://schemas.openxmlformats.org/officeDocument/2006/relationships/worksheet\" "
    "Target=\"worksheets/sheet1.xml\"/>"
    "<Relationship Id=\"rId2\" "
    "Type=\"http://schemas.openxmlformats.org/officeDocument/2006/relationships/styles\" "
    "Target=\"styles.xml\"/></Relationships>";

// Style 1 marks text that would read as a formula when edited: it stays text.
const char* const kEstilos =
    "<?xml version=\"1.0\" encoding=\"UTF-8\" standalone=\"yes\"?>\n"
    "<styleSheet xmlns=\"http://schemas.openxmlformats.org/spreadsheetml/2006/main\">"
    "<fonts count=\"1\"><font><sz val=\"11\"/><name val=\"Calibri\"/></font></fonts>"
    "<fills count=\"2\"><fill><patternFill patternType=\"none\"/></fill>"
    "<fill><patternFill patternType=\"gray125\"/></fill></fills>"
    "<borders count=\"1\"><border><left/><right/><top/><bottom/><diagonal/></border></borders>"
    "<cellStyleXfs count=\"1\"><xf numFmtId=\"0\" fontId=\"0\" fillId=\"0\" borderId=\"0\"/>"
    "</cellStyleXfs>"
    "<cellXfs count=\"2\"><xf numFmtId=\"0\" fontId=\"0\" fillId=\"0\" borderId=\"0\" xfId=\"0\"/>"
    "<xf numFmtId=\"0\" fontId=\"0\" fillId=\"0\" borderId=\"0\" xfId=\"0\" quotePrefix=\"1\"/>"
    "</cellXfs>"
    "<cellStyles count=\"1\"><cellStyle name=\"Normal\" xfId=\"0\" builtinId=\"0\"/></cellStyles>"
    "</styleSheet>";

}  // namespace

QString CEExcelFile::Referencia(int linha, int coluna) {
    QString letras;
    for (int c = coluna + 1; c > 0; c = (c - 1) / 26)
        letras.prepend(QChar('A' + (c - 1) % 26));
    return letras + QString::number(linha + 1);
}

bool CEExcelFile::Abre(const QString& caminho) {
    erro_.clear();
    linhas_.clear();
    ignoradas_ = 0;
    modelo_.clear();
    original_.clear();
    if (caminho.isEmpty() || !QFileInfo(caminho).exists()) return true;
    QFile arquivo(caminho);
    if (QFileInfo(caminho).isDir() || !arquivo.open(QIODevice::ReadOnly)) {
        erro_ = "the template workbook " + caminho + " can't be read";
        return false;
    }
    if (arquivo.size() > qint64(kMaxParte)) {
        erro_ = "the template workbook " + caminho + " is too large to be a template";
        return false;
    }
    original_ = arquivo.readAll();
    Arquivo a;
    QByteArray pasta;
    if (!AbreZip(a, original_, ZIP_RDONLY)) {
        erro_ = "the template workbook " + caminho + " is not a workbook (not a ZIP file)";
        return false;
    }
    if (!LeEntrada(a.zip, "xl/workbook.xml", pasta)) {
        erro_ = "the template workbook " + caminho + " is not a workbook (no xl/workbook.xml)";
        return false;
    }
    modelo_ = caminho;
    return true;
}

void CEExcelFile::SetCelula(int linha, int coluna, const QString& texto) {
    if (linha < 0 || coluna < 0 || linha >= kMaxLinhas || coluna >= kMaxColunas) {
        ++ignoradas_;
        return;
    }
    if (size_t(linha) >= linhas_.size()) linhas_.resize(size_t(linha) + 1);
    linhas_[size_t(linha)].emplace_back(coluna, texto.isNull() ? QStringLiteral("") : texto);
}

QByteArray CEExcelFile::Conteudo() {
    if (ignoradas_ > 0) {
        erro_ = QStringLiteral("%1 cells fall beyond the sheet's %2 rows and %3 columns")
                    .arg(ignoradas_)
                    .arg(kMaxLinhas)
                    .arg(kMaxColunas);
        return {};
    }
    // Each row's cells in column order, the last write of a cell winning.
    for (auto& linha : linhas_) {
        std::stable_sort(linha.begin(), linha.end(),
                         [](const auto& a, const auto& b) { return a.first < b.first; });
        std::vector<std::pair<int, QString>> unicas;
        unicas.reserve(linha.size());
        for (size_t i = 0; i < linha.size(); ++i)
            if (i + 1 == linha.size() || linha[i + 1].first != linha[i].first)
                unicas.push_back(std::move(linha[i]));
        linha = std::move(unicas);
    }
    return modelo_.isEmpty() ? NovaPasta() : PastaDoModelo();
}

bool CEExcelFile::Salva(const QString& caminho) {
    const QByteArray bytes = Conteudo();
    if (bytes.isEmpty()) return false;
    return zvsdk::saveFileAtomically(
        caminho, std::string_view(bytes.constData(), size_t(bytes.size())), &erro_);
}

QByteArray CEExcelFile::PlanilhaNova() const {
    std::string xml =
        "<?xml version=\"1.0\" encoding=\"UTF-8\" standalone=\"yes\"?>\n"
        "<worksheet xmlns=\"";
    xml += kNsPrincipal;
    xml += "\">";
    int primeira = -1, ultima = -1, colunas = 0;
    for (size_t r = 0; r < linhas_.size(); ++r) {
        if (linhas_[r].empty()) continue;
        if (primeira < 0) primeira = int(r);
        ultima = int(r);
        colunas = std::max(colunas, linhas_[r].back().first + 1);
    }
    if (primeira >= 0)
        xml += "<dimension ref=\"A" + std::to_string(primeira + 1) + ":" +
               Referencia(ultima, colunas - 1).toStdString() + "\"/>";
    // Column letters once, not once a cell.
    std::vector<std::string> letras(size_t(std::max(colunas, 0)));
    for (int c = 0; c < colunas; ++c) {
        const QString ref = Referencia(0, c);
        letras[size_t(c)] = ref.left(ref.size() - 1).toStdString();
    }
    xml += "<sheetData>";
    for (size_t r = 0; r < linhas_.size(); ++r) {
        if (linhas_[r].empty()) continue;
        const std::string numero = std::to_string(r + 1);
        xml += "<row r=\"" + numero + "\">";
        for (const auto& [coluna, texto] : linhas_[r]) {
            xml += "<c r=\"";
            xml += letras[size_t(coluna)];
            xml += numero;
            xml += PareceFormula(texto) ? "\" s=\"1\" t=\"inlineStr\"><is><t"
                                        : "\" t=\"inlineStr\"><is><t";
            if (Espacos(texto)) xml += " xml:space=\"preserve\"";
            xml += ">";
            if (TextoSimples(texto))
                for (const QChar ch : texto)
                    xml += char(ch.unicode());
            else
                EscapaXml(xml, CodificaOoxml(texto).toUtf8());
            xml += "</t></is></c>";
        }
        xml += "</row>";
    }
    xml += "</sheetData></worksheet>";
    return QByteArray(xml.data(), int(xml.size()));
}

QByteArray CEExcelFile::NovaPasta() {
    Arquivo a;
    if (!AbreZip(a, QByteArray(), ZIP_CREATE | ZIP_TRUNCATE)) {
        erro_ = QStringLiteral("could not make the workbook in memory");
        return {};
    }
    const QByteArray planilha = PlanilhaNova();
    const std::pair<const char*, QByteArray> partes[] = {
        {"[Content_Types].xml", kTiposConteudo},
        {"_rels/.rels", kRelacoes},
        {"xl/workbook.xml", kPasta},
        {"xl/_rels/workbook.xml.rels", kRelacoesPasta},
        {"xl/styles.xml", kEstilos},
        {"xl/worksheets/sheet1.xml", planilha},
    };
    for (const auto& [nome, bytes] : partes)
        if (!GravaEntrada(a.zip, nome, bytes,
                          std::strcmp(nome, "xl/worksheets/sheet1.xml") == 0 ? 1 : 6)) {
            erro_ = QStringLiteral("could not add %1 to the workbook").arg(nome);
            return {};
        }
    QByteArray saida;
    if (!FechaZip(a, saida)) erro_ = QStringLiteral("could not make the workbook in memory");
    return saida;
}

QByteArray CEExcelFile::PastaDoModelo() {
    const bool vazio = std::all_of(linhas_.begin(), linhas_.end(),
                                   [](const auto& linha) { return linha.empty(); });
    // Nothing to write: the workbook is saved as it came.
    if (vazio) return original_;
    const auto falha = [this](const QString& porque) {
        erro_ = "the template workbook " + modelo_ + " can't be used: " + porque;
        return QByteArray();
    };
    Arquivo a;
    if (!AbreZip(a, original_, 0)) return falha("it is not a ZIP file");

    // The first sheet: the workbook's first sheet element, through its relationship.
    QByteArray bytesPasta, bytesRelacoes;
    pugi::xml_document pasta, relacoes;
    if (!LeEntrada(a.zip, "xl/workbook.xml", bytesPasta) || !LeXml(bytesPasta, pasta))
        return falha("xl/workbook.xml can't be read");
    if (!LeEntrada(a.zip, "xl/_rels/workbook.xml.rels", bytesRelacoes) ||
        !LeXml(bytesRelacoes, relacoes))
        return falha("xl/_rels/workbook.xml.rels can't be read");
    const pugi::xml_node folhas = Filho(pasta.document_element(), "sheets");
    const pugi::xml_node primeira = Filho(folhas, "sheet");
    std::string rid;
    for (pugi::xml_attribute atributo : primeira.attributes())
        if (std::strcmp(Local(atributo.name()), "id") == 0 && std::strchr(atributo.name(), ':'))
            rid = atributo.value();
    if (rid.empty()) return falha("it has no sheet");
    std::string parte;
    pugi::xml_node calcChain;
    for (pugi::xml_node r : relacoes.document_element().children()) {
        if (rid == r.attribute("Id").value()) parte = ParteAlvo(r.attribute("Target").value());
        const std::string tipo = r.attribute("Type").value();
        if (tipo.size() >= 10 && tipo.compare(tipo.size() - 10, 10, "/calcChain") == 0)
            calcChain = r;
    }
    QByteArray bytesFolha;
    pugi::xml_document folha;
    if (parte.empty() || !LeEntrada(a.zip, parte, bytesFolha) || !LeXml(bytesFolha, folha))
        return falha("its first sheet can't be read");

    const pugi::xml_node planilha = folha.document_element();
    pugi::xml_node dados = Filho(planilha, "sheetData");
    const std::string px = Prefixo(planilha);
    if (!dados) return falha("its first sheet has no cell data");

    // The rows and their cells by number, with implicit positions made explicit.
    std::map<int, pugi::xml_node> linhas;
    int anterior = -1;
    int minLinha = kMaxLinhas, maxLinha = -1, minColuna = kMaxColunas, maxColuna = -1;
    const auto cobre = [&](int r, int c) {
        minLinha = std::min(minLinha, r);
        maxLinha = std::max(maxLinha, r);
        minColuna = std::min(minColuna, c);
        maxColuna = std::max(maxColuna, c);
    };
    for (pugi::xml_node no : dados.children()) {
        if (no.type() != pugi::node_element || std::strcmp(Local(no.name()), "row") != 0) continue;
        const int numero = no.attribute("r") ? no.attribute("r").as_int() - 1 : anterior + 1;
        if (!no.attribute("r")) no.append_attribute("r") = numero + 1;
        linhas[numero] = no;
        anterior = numero;
    }
    bool formulaSobrescrita = false;
    for (size_t r = 0; r < linhas_.size(); ++r) {
        if (linhas_[r].empty()) continue;
        const int numero = int(r);
        pugi::xml_node linha;
        if (auto it = linhas.find(numero); it != linhas.end()) {
            linha = it->second;
        } else {
            auto depois = linhas.upper_bound(numero);
            linha = depois == linhas.end()
                        ? dados.append_child((px + "row").c_str())
                        : dados.insert_child_before((px + "row").c_str(), depois->second);
            linha.append_attribute("r") = numero + 1;
            linhas[numero] = linha;
        }
        // Spans are a reader's hint, and would now be wrong.
        linha.remove_attribute("spans");
        std::map<int, pugi::xml_node> celulas;
        int col = -1;
        for (pugi::xml_node c : linha.children()) {
            if (c.type() != pugi::node_element || std::strcmp(Local(c.name()), "c") != 0) continue;
            int lr = numero, lc = col + 1;
            if (!c.attribute("r") || !LeReferencia(c.attribute("r").value(), lr, lc)) {
                lc = col + 1;
                c.remove_attribute("r");
                c.append_attribute("r") = Referencia(numero, lc).toUtf8().constData();
            }
            celulas[lc] = c;
            col = lc;
        }
        for (const auto& [coluna, texto] : linhas_[r]) {
            pugi::xml_node celula;
            if (auto it = celulas.find(coluna); it != celulas.end()) {
                celula = it->second;
            } else {
                auto depois = celulas.upper_bound(coluna);
                celula = depois == celulas.end()
                             ? linha.append_child((px + "c").c_str())
                             : linha.insert_child_before((px + "c").c_str(), depois->second);
                celula.append_attribute("r") = Referencia(numero, coluna).toUtf8().constData();
                celulas[coluna] = celula;
            }
            if (Filho(celula, "f")) formulaSobrescrita = true;
            while (celula.first_child())
                celula.remove_child(celula.first_child());
            // The cell keeps its style; its type and metadata go with its old value.
            celula.remove_attribute("t");
            celula.remove_attribute("cm");
            celula.remove_attribute("vm");
            celula.append_attribute("t") = "inlineStr";
            pugi::xml_node t =
                celula.append_child((px + "is").c_str()).append_child((px + "t").c_str());
            if (Espacos(texto)) t.append_attribute("xml:space") = "preserve";
            t.append_child(pugi::node_pcdata).set_value(CodificaOoxml(texto).toUtf8().constData());
            cobre(numero, coluna);
        }
    }
    // The sheet's dimension covers what was there and what was written.
    if (pugi::xml_node dimensao = Filho(planilha, "dimension")) {
        const QString ref = QString::fromUtf8(dimensao.attribute("ref").value());
        for (const QString& canto : ref.split(':')) {
            int r = 0, c = 0;
            if (LeReferencia(canto.toUtf8().constData(), r, c)) cobre(r, c);
        }
        const QString nova =
            Referencia(minLinha, minColuna) + ":" + Referencia(maxLinha, maxColuna);
        dimensao.remove_attribute("ref");
        dimensao.append_attribute("ref") = nova.toUtf8().constData();
    }

    QByteArray novaFolha = Xml(folha);
    QByteArray novasRelacoes, novosTipos;
    if (!GravaEntrada(a.zip, parte, novaFolha, 1))
        return falha("its first sheet can't be replaced");
    // A formula that was overwritten must leave the calculation chain too; without one the
    // spreadsheet builds it again.
    if (formulaSobrescrita && calcChain) {
        const std::string alvo = ParteAlvo(calcChain.attribute("Target").value());
        relacoes.document_element().remove_child(calcChain);
        novasRelacoes = Xml(relacoes);
        const zip_int64_t indice = zip_name_locate(a.zip, alvo.c_str(), 0);
        if (indice >= 0) zip_delete(a.zip, zip_uint64_t(indice));
        GravaEntrada(a.zip, "xl/_rels/workbook.xml.rels", novasRelacoes);
        QByteArray bytesTipos;
        pugi::xml_document tipos;
        if (LeEntrada(a.zip, "[Content_Types].xml", bytesTipos) && LeXml(bytesTipos, tipos)) {
            const std::string nomeParte = "/" + alvo;
            for (pugi::xml_node o : tipos.document_element().children())
                if (nomeParte == o.attribute("PartName").value()) {
                    tipos.document_element().remove_child(o);
                    break;
                }
            novosTipos = Xml(tipos);
            GravaEntrada(a.zip, "[Content_Types].xml", novosTipos);
        }
    }
    QByteArray saida;
    if (!FechaZip(a, saida)) return falha("the workbook could not be put together again");
    return saida;
}

}  // namespace zv
