#pragma once
// Runs the Python checker scripts of the drawing tests with the system's Python and ezdxf,
// and makes the DXF fixtures once per test run.
#include <QString>
#include <QStringList>

namespace zvtest {

class PythonChecker {
public:
    // Empty when /usr/bin/python3 with ezdxf is there; else what is missing.
    static QString missing();
    // Runs a script of tests/drawing with arguments; answers its exit status (-1 when it
    // could not run) and puts stdout and stderr in `output`.
    static int run(const QString& script, const QStringList& arguments, QString* output);
    // The folder of generated fixtures (made on first call); empty when generation failed.
    static QString fixtureFolder(QString* output = nullptr);
    // A fresh folder for files written by one test.
    static QString scratchFolder();
};

}  // namespace zvtest
