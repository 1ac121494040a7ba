#pragma once

/// Marks what hosts may call: the libraries are compiled with every other symbol hidden.
#define QVCT_API __attribute__((visibility("default")))
