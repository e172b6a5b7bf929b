#pragma once

/// Marks what a shared library of this project offers; everything else stays hidden.
/// One macro serves all libraries: with ELF the same attribute exports from one library and imports into another.
#define FOUNDATION_API __attribute__((visibility("default")))
