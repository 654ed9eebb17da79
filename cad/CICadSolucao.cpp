// The drawings a solution spans: the open documents, and project files read beside them.
#include "CICad.h"

#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "sdk/Document.h"
#include "sdk/DocumentManager.h"
#include "sdk/SystemServices.h"

#include <QFile>
#include <QFileInfo>

#include <exception>

std::vector<std::pair<QString, zvdb::Database*>> CICad::GetDesenhosAbertos() {
    std::vector<std::pair<QString, zvdb::Database*>> desenhos;
    zvsdk::SystemServices* servicos = zvsdk::systemServices();
    zvsdk::DocumentManager* documentos = servicos ? servicos->documentManager() : nullptr;
    for (int i = 0; documentos && i < documentos->documentCount(); ++i) {
        zvsdk::Document* documento = documentos->document(i);
        if (documento && documento->database())
            desenhos.emplace_back(QFileInfo(documento->fileName()).fileName(),
                                  documento->database());
    }
    return desenhos;
}

QString CICad::GetNomeDesenho(zvdb::Database* database) {
    zvdb::Database* procurada = database ? database : GetDatabase();
    for (const auto& [nome, db] : GetDesenhosAbertos())
        if (db == procurada) return nome;
    return {};
}

std::shared_ptr<zvdb::Database> CICad::AbreDesenhoLateral(const QString& arquivo) {
    const QString caminho = ResolveArquivo(arquivo);
    QFile f(caminho);
    if (caminho.isEmpty() || !f.open(QIODevice::ReadOnly)) {
        Imprime("\n" + arquivo + ": the project drawing can't be read.\n");
        return nullptr;
    }
    if (f.peek(4).startsWith("AC1")) {
        Imprime("\n" + caminho +
                ": a DWG drawing; this edition reads DXF drawings only. Save it as DXF.\n");
        return nullptr;
    }
    f.close();
    try {
        return std::shared_ptr<zvdb::Database>(zvdb::DxfLoader::loadFile(caminho.toStdString()));
    } catch (const std::exception& erro) {
        Imprime("\n" + caminho + ": " + QString::fromUtf8(erro.what()) + "\n");
        return nullptr;
    }
}
