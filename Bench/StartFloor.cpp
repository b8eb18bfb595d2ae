// The least that a program with a dialog costs: it starts, has an event loop for one round, and ends.

#include <QApplication>
#include <QTimer>

int main(int argc, char **argv)
{
    const QApplication application(argc, argv);
    QTimer::singleShot(0, &QCoreApplication::quit);
    return QApplication::exec();
}
