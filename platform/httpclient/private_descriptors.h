#pragma once

#include <set>

/// Keeps child processes started later from inheriting the file descriptors that the program opens while this
/// object lives.
///
/// Needed for the pipes that libcurl opens internally: one wakes it up, one returns the result of a name
/// lookup. Both stay open longer than the call that opened them.
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
