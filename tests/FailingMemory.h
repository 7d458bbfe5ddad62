// Stands in the place of `operator new`, so that memory runs out when a test says so. A test program that
// links FailingMemory.cpp sees every allocation of the libraries too, since the dynamic linker takes the
// program's own operator first. All of it is about the calling thread alone.
#pragma once

namespace failing {

// Lets the n-th allocation from now fail and those after it succeed, 1 being the next one.
void allocation(unsigned int n);

// Lets every allocation fail from the n-th on; 0: none.
void allocationsFrom(unsigned int n);

// Ends failing. Returns whether an allocation has failed since it began.
bool ended();

// How many allocations have been asked for since allocation() or allocationsFrom() was called, up to ended().
unsigned int allocations();

// Whether the first allocation that failed was asked for by a library, itself or through the C++ library;
// `name` is a part of its file's name.
bool failedIn(const char* name);

} // namespace failing
