#pragma once

#include <set>

/// Keeps the file descriptors that the program opens while this object lives from child processes that it
/// starts later.
///
/// For what libcurl opens without asking: the ends of the pipes by which it is woken up, and by which a name
/// lookup tells its result. Both are left open for longer than the call that opened them.
class PrivateDescriptors
{
public:
    PrivateDescriptors();
    ~PrivateDescriptors();
    PrivateDescriptors(const PrivateDescriptors&) = delete;
    PrivateDescriptors& operator=(const PrivateDescriptors&) = delete;

private:
    std::set<int> m_before;
};
