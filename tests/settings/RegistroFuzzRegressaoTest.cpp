// Every seed of the settings file's fuzz target, and every input it ever failed on, run in
// the normal test suite with the same checks (fuzz/ConfereRegistro.h).
#include "AmbienteTeste.h"
#include "fuzz/ConfereRegistro.h"

#include <QDirIterator>

namespace {

class RegistroFuzzRegressaoTest : public AmbienteTeste {};

TEST_F(RegistroFuzzRegressaoTest, SeedsAndFoundInputsKeepTheFileSafe) {
    ASSERT_TRUE(QDir().mkpath(PastaDados() + "/FV"));
    int arquivos = 0;
    for (const char* pasta : {"/corpus", "/regressions"}) {
        QDirIterator it(QString(ZV_FUZZ_DIR) + pasta, QDir::Files);
        while (it.hasNext()) {
            const QString caminho = it.next();
            EXPECT_EQ(ConfereRegistro(Le(caminho)).toStdString(), "") << caminho.toStdString();
            ++arquivos;
        }
    }
    EXPECT_GE(arquivos, 9);
}

}  // namespace
