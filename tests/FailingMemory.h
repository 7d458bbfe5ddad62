// Makes memory run out: a test program that links FailingMemory.cpp has its own `operator new`.
#pragma once

namespace failing {

// Lets every allocation of this thread fail from the n-th on, 1 being the next one; 0: none.
void allocationsFrom(unsigned int n);

// How many allocations this thread has asked for since that was called.
unsigned int allocations();

} // namespace failing
