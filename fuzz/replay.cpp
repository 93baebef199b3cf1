// SPDX-License-Identifier: Apache-2.0
// Runs every file of the corpus through its target: what fuzzing has found stays found, with any compiler.

#include "targets.h"

#include <QDir>
#include <QFile>

#include <cstdio>

int main(int argc, char* argv[])
{
    qInstallMessageHandler([](QtMsgType, const QMessageLogContext&, const QString&) {});
    const QDir corpus(QString::fromLocal8Bit(argc > 1 ? argv[1] : "."));
    for (const fuzz::Target& target : fuzz::targets()) {
        const QFileInfoList files = QDir(corpus.filePath(target.name)).entryInfoList(QDir::Files);
        if (files.isEmpty()) {
            std::fprintf(stderr, "%s: no corpus\n", target.name);
            return 1;
        }
        for (const QFileInfo& info : files) {
            std::printf("%s/%s\n", target.name, qPrintable(info.fileName()));
            std::fflush(stdout);
            QFile file(info.filePath());
            if (!file.open(QIODevice::ReadOnly))
                return 1;
            fuzz::run(target, file.readAll());
        }
    }
    return 0;
}
