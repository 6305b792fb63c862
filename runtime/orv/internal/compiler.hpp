// What compilers must be able to do, and what only some can.
#pragma once

// Messages, texts and bytes reach this header before the others: what cannot compile them says so here, and stops at
// a file that is not there, in place of hundreds of errors.
#if __has_include(<version>)
#include <version>
#endif
#ifndef __cpp_lib_expected
#error "orv needs C++23: g++ 12 or clang 19, or newer, with -std=c++23"
#include "orv needs C++23"
#endif

// Behind that of which a function's result is a view: clang warns where it is a temporary that the view outlives.
#ifdef __clang__
#define ORV_BOUND [[clang::lifetimebound]]
#else
#define ORV_BOUND
#endif
