// Calls an export from a list of argument values, converting each value to
// the type the prototype takes. The kinds of the prototype's parameters are
// compared with the descriptor's argument list, so the two cannot drift.
#pragma once

#include <type_traits>
#include <utility>
#include <vector>

#include "frame/descriptor.h"

namespace zel::meta {

template <typename T>
constexpr ArgKind kindOf() {
  if constexpr (std::is_pointer_v<T>) return ArgKind::Pointer;
  else if constexpr (std::is_same_v<T, ImageSize>) return ArgKind::Size;
  else if constexpr (std::is_same_v<T, CfaRegion>) return ArgKind::Region;
  else if constexpr (std::is_same_v<T, float>) return ArgKind::Float32;
  else if constexpr (std::is_same_v<T, double>) return ArgKind::Float64;
  else if constexpr (std::is_same_v<T, uint8_t>) return ArgKind::UInt8;
  else if constexpr (std::is_same_v<T, uint16_t>) return ArgKind::UInt16;
  else if constexpr (std::is_same_v<T, int16_t>) return ArgKind::Int16;
  else {
    static_assert(std::is_same_v<T, int> || std::is_enum_v<T>, "unsupported parameter type");
    return ArgKind::Int32;
  }
}

template <typename T>
T fromArg(const Arg& a) {
  if constexpr (std::is_pointer_v<T>) return reinterpret_cast<T>(const_cast<void*>(a.p));
  else if constexpr (std::is_same_v<T, ImageSize>) return a.size;
  else if constexpr (std::is_same_v<T, CfaRegion>) return a.region;
  else if constexpr (std::is_floating_point_v<T>) return static_cast<T>(a.f);
  else return static_cast<T>(a.i);
}

template <typename Sig, Sig F>
struct InvokerOf;

template <typename R, typename... A, R (*F)(A...)>
struct InvokerOf<R (*)(A...), F> {
  static Status call(const Arg* args, int count) {
    if constexpr (std::is_same_v<R, Status>) {
      if (count != int(sizeof...(A))) return static_cast<Status>(-1000);
      return callWith(args, std::index_sequence_for<A...>{});
    } else {
      (void)args;
      (void)count;
      return static_cast<Status>(-1000);
    }
  }
  template <std::size_t... I>
  static R callWith(const Arg* args, std::index_sequence<I...>) {
    return F(fromArg<A>(args[I])...);
  }
  static std::vector<ArgKind> kinds() { return {kindOf<A>()...}; }
};

}  // namespace zel::meta
