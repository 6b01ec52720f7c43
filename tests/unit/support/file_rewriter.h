#pragma once

#include <QByteArray>
#include <QFile>
#include <QVector>

#include <fcntl.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>

/// A process that, while this object lives, truncates a file and writes it anew without end, each time with
/// the next of the contents.
class FileRewriter
{
public:
    FileRewriter(const QString& path, const QVector<QByteArray>& contents)
        : m_pid(fork())
    {
        if (m_pid < 0) {
            qFatal("cannot start a second process");
        }
        if (m_pid == 0) {
            prctl(PR_SET_PDEATHSIG, SIGKILL);
            rewriteForEver(QFile::encodeName(path), contents);
        }
    }
    ~FileRewriter()
    {
        kill(m_pid, SIGKILL);
        waitpid(m_pid, nullptr, 0);
    }
    Q_DISABLE_COPY_MOVE(FileRewriter)

private:
    [[noreturn]] static void rewriteForEver(const QByteArray& path, const QVector<QByteArray>& contents)
    {
        constexpr useconds_t pause = 20; // widens both states, so that a reader meets each of them
        for (int turn = 0;; turn = (turn + 1) % contents.size()) {
            const QByteArray& content = contents.at(turn);
            const int file = ::open(path.constData(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
            usleep(pause);
            if (::write(file, content.constData(), static_cast<size_t>(content.size())) != content.size()) {
                _exit(1);
            }
            ::close(file);
            usleep(pause);
        }
    }

    pid_t m_pid;
};
