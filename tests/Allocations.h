// Stands in the place of operator new, so that memory runs out when a test says so. A test program that links
// Allocations.cpp sees every allocation of the library, since the dynamic linker takes the program's own
// operator first.
#pragma once

// Lets the calling thread's n-th allocation from now (from 1) throw std::bad_alloc, and none after it; 0
// none. Returns whether the one that was to fail before has been reached.
bool failAllocation(unsigned int n);
