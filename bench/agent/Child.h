// SPDX-License-Identifier: BSD-2-Clause
// A process of the benchmark's own, forked off it.
#pragma once

#include <sys/types.h>

#include <functional>
#include <string>
#include <vector>

/// Ends with its owner, however the owner ends. Owners on a thread of their own must outlive it.
class Child {
  public:
    /// Runs `body` in a fork of this process, which must have one thread only.
    explicit Child(std::function<int()> const& body);
    /// Runs a program, found on the PATH, with its output thrown away.
    explicit Child(std::vector<std::string> const& command);
    ~Child();
    Child(Child const&) = delete;
    Child& operator=(Child const&) = delete;

    pid_t process() const { return m_pid; }
    /// Waits for the end; returns the exit status, 128 and the signal when one ended it.
    int wait();

  private:
    pid_t m_pid;
};

/// Binds the calling thread, and all threads and processes that it starts, to one processor: the
/// last one that it may use.
void useOneProcessor();

/// A folder that is there while its owner is.
class Folder {
  public:
    Folder();
    ~Folder();
    Folder(Folder const&) = delete;
    Folder& operator=(Folder const&) = delete;

    std::string path(std::string const& name) const { return m_path + "/" + name; }
    void write(std::string const& name, std::string const& text) const;

  private:
    std::string m_path;
};
