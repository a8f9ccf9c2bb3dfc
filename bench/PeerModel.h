// SPDX-License-Identifier: BSD-2-Clause
// The delivery of an administrative event as one would write it with std::shared_ptr: the same
// stages, the same events, everything passed by value.
#pragma once

#include <algorithm>
#include <ctime>
#include <map>
#include <memory>
#include <mutex>
#include <vector>

namespace peer {

class Board;

struct ExternalEvent {
    virtual ~ExternalEvent() = default;
    unsigned id = 0;
    int board = 0;
};

struct StatusEvent {
    virtual ~StatusEvent() = default;
    int status = 0;
    std::shared_ptr<Board> board;
};

class StatusListener {
  public:
    virtual void process(std::shared_ptr<StatusEvent> event) = 0;

  protected:
    ~StatusListener() = default;
};

/// What the owner of listeners does on each notification.
class Notifier {
  public:
    void add(StatusListener* listener) { m_listeners.push_back(listener); }

    void notify(std::shared_ptr<Board> board, int status) {
        auto event = std::make_shared<StatusEvent>();
        event->status = status;
        event->board = std::move(board);
        relay(event);
    }

    void relay(std::shared_ptr<StatusEvent> event) {
        for (StatusListener* listener : m_listeners)
            listener->process(event);
    }

  private:
    std::vector<StatusListener*> m_listeners;
};

class Board : public std::enable_shared_from_this<Board> {
  public:
    virtual ~Board() = default;
    virtual int status() { return 3; }
    virtual int secondaryStatus() { return 0; }
    virtual void setStatus(int) {}
    virtual void stop() {}

    Notifier& listeners() { return m_listeners; }

    void deliver(int status) {
        long const now = std::time(nullptr);
        int const current = this->status();
        secondaryStatus();
        if (status == 4 && current != 4) {
            setStatus(4);
            setDate(now);
            m_listeners.notify(shared_from_this(), 4);
            stop();
        }
        setLastCondition(0);
        this->status();
    }

  private:
    void setDate(long date) {
        std::scoped_lock const guard(m_mutex);
        m_date = date;
    }
    void setLastCondition(int condition) {
        std::scoped_lock const guard(m_mutex);
        m_lastCondition = condition;
    }

    Notifier m_listeners;
    std::mutex m_mutex;
    long m_date = 0;
    int m_lastCondition = 0;
};

class EventListener {
  public:
    virtual void process(std::shared_ptr<ExternalEvent> event) = 0;

  protected:
    ~EventListener() = default;
};

class Factory final : public EventListener, public StatusListener {
  public:
    explicit Factory(int boards) {
        for (int id = 1; id <= boards; ++id) {
            auto board = std::make_shared<Board>();
            board->listeners().add(this);
            m_boards.emplace(id, board);
        }
    }

    Notifier& listeners() { return m_listeners; }

    void process(std::shared_ptr<ExternalEvent> event) override {
        if (event->id == 0x40008) notify(event->board, 4);
    }

    void process(std::shared_ptr<StatusEvent> event) override {
        m_listeners.notify(event->board, event->status);
    }

    void notify(int id, int status) {
        std::shared_ptr<Board> board;
        {
            std::scoped_lock const guard(m_mutex);
            auto const found = m_boards.find(id);
            if (found == m_boards.end()) return;
            board = found->second;
        }
        board->deliver(status);
    }

    void notifyAll(int status) {
        std::map<long, std::shared_ptr<Board>> boards;
        {
            std::scoped_lock const guard(m_mutex);
            boards = m_boards;
        }
        for (auto const& [id, board] : boards)
            board->deliver(status);
    }

    std::map<long, std::shared_ptr<Board>> const& boards() const { return m_boards; }

  private:
    Notifier m_listeners;
    std::mutex m_mutex;
    std::map<long, std::shared_ptr<Board>> m_boards;
};

class Manager final : public StatusListener {
  public:
    explicit Manager(Factory& factory) { factory.listeners().add(this); }
    Notifier& listeners() { return m_listeners; }
    void process(std::shared_ptr<StatusEvent> event) override { m_listeners.relay(event); }

  private:
    Notifier m_listeners;
};

class Adaptor {
  public:
    void add(EventListener* listener) { m_listeners.push_back(listener); }
    void handle(unsigned id, int board) {
        auto event = std::make_shared<ExternalEvent>();
        event->id = id;
        event->board = board;
        for (EventListener* listener : m_listeners)
            listener->process(event);
    }

  private:
    std::vector<EventListener*> m_listeners;
};

} // namespace peer
