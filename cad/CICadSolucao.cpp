// The drawings a solution spans: the open documents, and project files read beside them.
#include "CICad.h"

#include "app/DrawingFiles.h"
#include "drawing/Database.h"
#include "sdk/Document.h"
#include "sdk/DocumentManager.h"
#include "sdk/SystemServices.h"

#include <QFileInfo>

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
    if (caminho.isEmpty() || !QFileInfo(caminho).isFile()) {
        Imprime("\n" + arquivo + ": the project drawing can't be read.\n");
        return nullptr;
    }
    QString erro;
    std::shared_ptr<zvdb::Database> desenho = zvhost::readDrawing(caminho, &erro);
    if (!desenho) Imprime("\n" + erro + "\n");
    return desenho;
}
