#include "app/qt_messages.h"

#include <QHash>
#include <QMutex>
#include <QtGlobal>
#include <cstdio>

namespace quillane {
namespace {

QtMessageHandler previousHandler = nullptr;
int repeatLimit = 5;
// Messages may come from any thread.
QMutex countsMutex;
QHash<QString, int> counts;

void Forward(QtMsgType type, const QMessageLogContext& context, const QString& message) {
  if (previousHandler != nullptr) {
    previousHandler(type, context, message);
  } else {
    const QByteArray line = qFormatLogMessage(type, context, message).toLocal8Bit();
    std::fprintf(stderr, "%s\n", line.constData());
  }
}

void LimitingHandler(QtMsgType type, const QMessageLogContext& context, const QString& message) {
  if (type == QtFatalMsg) {
    Forward(type, context, message);
    return;
  }
  int seen;
  {
    QMutexLocker lock(&countsMutex);
    seen = ++counts[MessageKind(message)];
  }
  if (seen <= repeatLimit)
    Forward(type, context, message);
  else if (seen == repeatLimit + 1)
    Forward(type, context,
            QStringLiteral("(further messages like \"%1\" are not shown)").arg(message));
}

}  // namespace

QString MessageKind(const QString& message) {
  QString kind;
  kind.reserve(message.size());
  for (qsizetype i = 0; i < message.size(); ++i) {
    if (!message[i].isDigit()) {
      kind += message[i];
    } else if (i == 0 || !message[i - 1].isDigit()) {
      kind += '#';
    }
  }
  return kind;
}

void LimitRepeatedQtMessages(int limit) {
  repeatLimit = limit;
  QtMessageHandler previous = qInstallMessageHandler(LimitingHandler);
  // Installed twice, it would find itself as the handler before it.
  if (previous != LimitingHandler) previousHandler = previous;
}

}  // namespace quillane
