// SPDX-License-Identifier: Apache-2.0
// One fuzzer: the target ZENT_FUZZ_TARGET, driven by libFuzzer.

#include "jsonmutator.h"
#include "targets.h"

#include <QtGlobal>

#include <algorithm>
#include <cstdint>

extern "C" int LLVMFuzzerInitialize(int*, char***)
{
    qInstallMessageHandler([](QtMsgType, const QMessageLogContext&, const QString&) {});
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    static const fuzz::Target* const target = fuzz::findTarget(ZENT_FUZZ_TARGET);
    fuzz::run(*target, QByteArray(reinterpret_cast<const char*>(data), static_cast<int>(size)));
    return 0;
}

extern "C" std::size_t LLVMFuzzerMutate(std::uint8_t* data, std::size_t size, std::size_t maxSize);

/// Qt's JSON reader is not instrumented, and changed bytes alone hardly ever leave a text JSON: half of the changes are
/// made to the values.
extern "C" std::size_t LLVMFuzzerCustomMutator(std::uint8_t* data, std::size_t size, std::size_t maxSize,
                                               unsigned int seed)
{
    if (seed % 2 == 0)
        return LLVMFuzzerMutate(data, size, maxSize);
    const QByteArray changed =
        fuzz::mutateJson(QByteArray(reinterpret_cast<const char*>(data), static_cast<int>(size)), seed);
    if (changed.isEmpty() || static_cast<std::size_t>(changed.size()) > maxSize)
        return LLVMFuzzerMutate(data, size, maxSize);
    std::copy(changed.begin(), changed.end(), data);
    return static_cast<std::size_t>(changed.size());
}
