// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <mutex>

class QThread;

namespace zent::http
{

class Speaker;
struct Exchange;

/// The thread that does the requests of an HttpClientApi. It exists only while there is something to ask.
class HttpThread
{
public:
    HttpThread();
    ~HttpThread();
    HttpThread(const HttpThread&) = delete;
    HttpThread& operator=(const HttpThread&) = delete;

    /// Has the exchange done; starts the thread where there is none.
    void send(const std::shared_ptr<Exchange>& exchange);
    /// Ends an exchange that was sent and that nobody waits for any more.
    void abandon(const std::shared_ptr<Exchange>& exchange);
    /// Ends the thread, and with it what is under way.
    void stop();

private:
    /// What the two threads share.
    struct State {
        std::mutex mutex;
        bool ended = false;
        /// Exchanges that were handed over and have not arrived; the thread does not end before them.
        int underWay = 1;
    };

    /// Has the thread stay for one more exchange; false where there is none.
    bool keep();
    /// Starts the thread for one exchange.
    void start();

    std::shared_ptr<State> m_state;
    std::unique_ptr<QThread> m_thread;
    Speaker* m_speaker = nullptr;
};

} // namespace zent::http
