// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QByteArray>

namespace fuzz
{

/// The JSON text with one of its values changed, left out or put in twice; empty when the input is no JSON.
QByteArray mutateJson(const QByteArray& json, unsigned int seed);

} // namespace fuzz
