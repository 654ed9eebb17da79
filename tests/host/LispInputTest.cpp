// The input functions with scripted answers ("prompt:TEXT=VALUE"), initget's bits and
// keywords, entity picks, and a prompt left unanswered as a cancelling user.
#include "LispHostFixture.h"
#include "QtPrinters.h"
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"

namespace {

class LispInputTest : public LispHostFixture {};

TEST_F(LispInputTest, NumbersAndTexts) {
    ui->setAnswer("prompt:Número de cópias", "3");
    EXPECT_EQ(ev("(getint \"\\nNúmero de cópias: \")"), "3");
    EXPECT_TRUE(commandLine.contains("Número de cópias: 3\n")) << commandLine.toStdString();
    ui->setAnswer("prompt:Escala", "2.5");
    EXPECT_EQ(ev("(getreal \"Escala: \")"), "2.5");
    ui->setAnswer("prompt:Escala", "7");
    EXPECT_EQ(ev("(getreal \"Escala: \")"), "7.0");
    ui->setAnswer("prompt:Cliente", "ACME Ltda");
    EXPECT_EQ(ev("(getstring \"Cliente: \")"), "\"ACME\"");  // a space ends the input
    EXPECT_EQ(ev("(getstring T \"Cliente: \")"), "\"ACME Ltda\"");
    ui->setAnswer("prompt:Vazio", "");
    EXPECT_EQ(ev("(getint \"Vazio: \")"), "nil");  // Enter
    EXPECT_EQ(ev("(getstring \"Vazio: \")"), "\"\"");
    EXPECT_EQ(ev("(getint 5)"), "ERROR: bad argument type: stringp 5");
    EXPECT_EQ(ev("(getint \"a\" \"b\")"), "ERROR: too many arguments");
}

TEST_F(LispInputTest, RejectedAnswersAreToldAndARepeatedOneCancels) {
    ui->setAnswer("prompt:N", "abc");
    EXPECT_EQ(ev("(getint \"N: \")"), "ERROR: Function cancelled");
    EXPECT_TRUE(commandLine.contains("Requires an integer value.")) << commandLine.toStdString();
    ui->setAnswer("prompt:N", "40000");
    EXPECT_EQ(ev("(getint \"N: \")"), "ERROR: Function cancelled");
    EXPECT_TRUE(commandLine.contains("Requires an integer between -32768 and 32767."));
    ui->setAnswer("prompt:N", "0");
    EXPECT_EQ(ev("(initget 2) (getint \"N: \")"), "ERROR: Function cancelled");
    EXPECT_TRUE(commandLine.contains("Value must not be zero.")) << commandLine.toStdString();
    ui->setAnswer("prompt:N", "-2");
    EXPECT_EQ(ev("(initget 4) (getreal \"N: \")"), "ERROR: Function cancelled");
    EXPECT_EQ(ev("(getreal \"N: \")"), "-2.0");  // initget spoke for one call only
    ui->setAnswer("prompt:N", "");
    EXPECT_EQ(ev("(initget 1) (getint \"N: \")"), "ERROR: Function cancelled");
    EXPECT_TRUE(commandLine.contains("A value is required.")) << commandLine.toStdString();
    // Arbitrary input comes back as typed.
    ui->setAnswer("prompt:N", "muitos");
    EXPECT_EQ(ev("(initget 128) (getint \"N: \")"), "\"muitos\"");
}

TEST_F(LispInputTest, KeywordsOfInitget) {
    ui->setAnswer("prompt:Continuar? [Sim/Nao]", "s");
    EXPECT_EQ(ev("(initget 1 \"Sim Nao\") (getkword \"Continuar? [Sim/Nao]: \")"), "\"Sim\"");
    // Local names answer their global ones.
    EXPECT_EQ(ev("(initget \"Sim Nao _Yes No\") (getkword \"Continuar? [Sim/Nao]: \")"), "\"Yes\"");
    ui->setAnswer("prompt:Continuar? [Sim/Nao]", "_No");
    EXPECT_EQ(ev("(initget \"Sim Nao _Yes No\") (getkword \"Continuar? [Sim/Nao]: \")"), "\"No\"");
    ui->setAnswer("prompt:Continuar? [Sim/Nao]", "talvez");
    EXPECT_EQ(ev("(initget \"Sim Nao\") (getkword \"Continuar? [Sim/Nao]: \")"),
              "ERROR: Function cancelled");
    EXPECT_TRUE(commandLine.contains("Invalid option keyword.")) << commandLine.toStdString();
    // An all-capitals keyword is typed whole; "LType,LT" sets its shortest form.
    ui->setAnswer("prompt:Opcao", "tod");
    EXPECT_EQ(ev("(initget \"TODOS\") (getkword \"Opcao: \")"), "ERROR: Function cancelled");
    ui->setAnswer("prompt:Opcao", "lt");
    EXPECT_EQ(ev("(initget \"LType,LT Cor\") (getkword \"Opcao: \")"), "\"LType\"");
    // A number input takes the keywords too.
    ui->setAnswer("prompt:Quantos", "todos");
    EXPECT_EQ(ev("(initget \"Todos\") (getint \"Quantos: \")"), "\"Todos\"");
    EXPECT_EQ(ev("(getkword \"Opcao: \")"), "ERROR: getkword: no keywords: call initget first");
}

TEST_F(LispInputTest, PointsDistancesAndAngles) {
    ui->setAnswer("prompt:Ponto", "10,20");
    EXPECT_EQ(ev("(getpoint \"Ponto: \")"), "(10.0 20.0 0.0)");
    ui->setAnswer("prompt:Ponto", "1,2,3");
    EXPECT_EQ(ev("(getpoint '(5 5) \"Ponto: \")"), "(1.0 2.0 3.0)");
    ui->setAnswer("prompt:Ponto", "@2,3");
    EXPECT_EQ(ev("(getpoint '(1 1) \"Ponto: \")"), "(3.0 4.0 0.0)");
    EXPECT_EQ(ev("(getcorner '(1 1) \"Ponto: \")"), "(3.0 4.0 0.0)");
    EXPECT_EQ(ev("(getcorner)"), "ERROR: too few arguments");
    ui->setAnswer("prompt:Ponto", "10;20");
    EXPECT_EQ(ev("(getpoint \"Ponto: \")"), "ERROR: Function cancelled");
    ui->setAnswer("prompt:Distancia", "12.5");
    EXPECT_EQ(ev("(getdist \"Distancia: \")"), "12.5");
    ui->setAnswer("prompt:Distancia", "1'6\"");
    EXPECT_EQ(ev("(getdist \"Distancia: \")"), "18.0");
    ui->setAnswer("prompt:Distancia", "3,4");
    EXPECT_EQ(ev("(getdist '(0 0) \"Distancia: \")"), "5.0");
    ui->setAnswer("prompt:Distancia", "3,4,12");
    EXPECT_EQ(ev("(getdist '(0 0 0) \"Distancia: \")"), "13.0");
    EXPECT_EQ(ev("(initget 64) (getdist '(0 0 0) \"Distancia: \")"), "5.0");
    // Without a base point a second point is asked for.
    ui->setAnswer("prompt:Distancia", "1,1");
    ui->setAnswer("prompt:Specify second point", "4,5");
    EXPECT_EQ(ev("(getdist \"Distancia: \")"), "5.0");
    ui->setAnswer("prompt:Angulo", "90");
    EXPECT_EQ(ev("(getangle \"Angulo: \")"), "1.5708");
    EXPECT_EQ(ev("(getorient \"Angulo: \")"), "1.5708");
    ui->setAnswer("prompt:Angulo", "-1,0");
    EXPECT_EQ(ev("(getangle '(0 0) \"Angulo: \")"), "3.14159");
}

TEST_F(LispInputTest, PicksByPoint) {
    zvdb::Database& db = *document->database();
    db.modelSpace()->addLine({0, 0, 0}, {10, 0, 0}, "0");
    zvdb::BlockRecord* block = db.createBlock("BORNE");
    block->addCircle({0, 0, 0}, 1);
    block->addAttributeDefinition("REGUA", "Strip", "", {0, 0, 0}, 1);
    zvdb::BlockReference* reference =
        db.modelSpace()->addBlockReference(*block, {50, 50, 0}, {1, 1, 1}, 0, "0");
    reference->addAttributeFromDefinition(*block->attributeDefinitions().front())
        ->setTextValue("X1");
    ui->setAnswer("prompt:Select object", "5,0");
    EXPECT_EQ(ev("(cdr (assoc 0 (entget (car (entsel)))))"), "\"LINE\"");
    EXPECT_EQ(ev("(cadr (entsel))"), "(5.0 0.0 0.0)");
    ui->setAnswer("prompt:Select object", "5,5");
    EXPECT_EQ(ev("(entsel)"), "nil");  // nothing there
    ui->setAnswer("prompt:Escolha o borne", "50.5,50.5");
    EXPECT_EQ(ev("(cdr (assoc 0 (entget (car (entsel \"Escolha o borne: \")))))"), "\"INSERT\"");
    EXPECT_EQ(ev("(cdr (assoc 0 (entget (car (nentsel \"Escolha o borne: \")))))"), "\"ATTRIB\"");
    ui->setAnswer("prompt:Select object", "");
    EXPECT_EQ(ev("(entsel)"), "nil");
}

TEST_F(LispInputTest, AnUnansweredPromptCancels) {
    EXPECT_EQ(ev("(getint \"Quantidade: \")"), "ERROR: Function cancelled");
    EXPECT_TRUE(messages.contains("no answer for prompt 'prompt:Quantidade'"))
        << messages.toStdString();
    // A program can catch it, as it would catch the user's Esc.
    EXPECT_EQ(ev("(vl-catch-all-error-message (vl-catch-all-apply 'getpoint '(\"P: \")))"),
              "\"Function cancelled\"");
    // *error* hears it.
    EXPECT_EQ(ev("(defun *error* (m) (setq ouvido m)) (getreal) ouvido"),
              "ERROR: Function cancelled");
    EXPECT_EQ(ev("ouvido"), "\"Function cancelled\"");
}

}  // namespace
