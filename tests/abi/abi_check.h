// Compile-time layout checks shared by the ABI test files.
#pragma once

#include <cstddef>
#include <type_traits>

// Proves both where a struct member sits and exactly what C type it has.
// The type is variadic because function pointer types contain commas.
#define CMPI_ASSERT_MEMBER(Struct, member, offset, ...)                        \
    static_assert(offsetof(Struct, member) == (offset),                        \
                  #Struct "::" #member " is at the wrong offset");             \
    static_assert(std::is_same_v<decltype(Struct::member), __VA_ARGS__>,       \
                  #Struct "::" #member " has the wrong type")
