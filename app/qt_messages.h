// Qt's own warnings (a reader complaining about a damaged file, a missing platform service) are
// useful once and noise when one file repeats them thousands of times.
#pragma once

#include <QString>

namespace quillane {

// From now on each kind of Qt message (its text with the numbers in it left out) reaches the
// handler that was installed before at most limit times; the next one is followed by a line
// saying that further ones are not shown.
void LimitRepeatedQtMessages(int limit = 5);

// The text that identifies a message's kind: every run of digits becomes "#".
QString MessageKind(const QString& message);

}  // namespace quillane
