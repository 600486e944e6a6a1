// HLS vector blocks, written once over a lane set V (4 floats with SSE4.1,
// 8 with AVX2, 16 with the 512-bit tier). This file is included once for
// each instruction set, inside a namespace of its own and, for the wider
// ones, with the target enabled; nothing here is visible outside those
// namespaces. Every lane computes exactly its scalar formula in
// hls_formulas.h. Comparisons give V::M: all-ones lanes in the narrower
// sets, a mask register in the widest; the masked helpers (addWhere and
// the like) are a select of the plain result where the set has no masked
// form.

template <class V, bool Refined>
inline typename V::F reciprocalLanes(typename V::F x) {
  const typename V::F r = V::rcp(x);
  if constexpr (!Refined) return r;
  else return V::sub(V::add(r, r), V::mul(V::mul(x, r), r));
}

template <class V>
inline typename V::I convertLanes(bool round, typename V::F x) {
  return round ? V::round(x) : V::truncate(x);
}

// ---- forward ----

template <class V, class R>
inline void forwardLanes(typename V::F r, typename V::F g, typename V::F b, typename V::I* out) {
  using F = typename V::F;
  const F zero = V::set(0.0f), one = V::set(1.0f);
  const F mx = V::max(V::max(r, g), b), mn = V::min(V::min(r, g), b);
  const F sum = V::add(mx, mn), spread = V::sub(mx, mn);
  const F light = V::mul(sum, V::set(0.5f));
  const typename V::M flat = V::eq(spread, zero);
  const F d = V::select(flat, one, V::select(V::le(light, V::set(R::kHalf)), sum, V::sub(V::set(R::kFull), sum)));
  const F rateBase = V::select(flat, one, spread);
  F sat = V::mul(V::mul(spread, reciprocalLanes<V, R::kRefined>(d)), V::set(R::kRange));
  const typename V::M isR = V::eq(mx, r);
  const typename V::M isG = V::maskAndNot(isR, V::eq(mx, g));
  const F diff = V::select(isR, V::sub(g, b), V::select(isG, V::sub(b, r), V::sub(r, g)));
  const F base = V::select(isR, zero, V::select(isG, V::set(120.0f), V::set(240.0f)));
  const F rate = reciprocalLanes<V, R::kRefined>(rateBase);
  F hue;
  if constexpr (R::kForm == HueForm::RateFirst) hue = V::add(V::mul(V::mul(rate, V::set(60.0f)), diff), base);
  else hue = V::add(V::mul(V::mul(diff, V::set(60.0f)), rate), base);
  hue = V::select(V::lt(hue, zero), V::add(hue, V::set(360.0f)), hue);
  const F h = V::andNot(flat, V::mul(hue, V::set(R::kHue)));
  sat = V::andNot(flat, sat);
  out[0] = V::clamp(convertLanes<V>(R::kRoundBody, h), R::kMax);
  out[1] = V::clamp(convertLanes<V>(R::kRoundBody, light), R::kMax);
  out[2] = V::clamp(convertLanes<V>(R::kRoundBody, sat), R::kMax);
}

// Groups of 4 * V::kGroups pixels from x while they fit below `end`;
// returns where it stopped.
template <class V, class M>
inline int forwardGroups(const typename M::In& in, const typename M::Out& out, int x, int end) {
  using F = typename V::F;
  using I = typename V::I;
  constexpr int kStep = 4 * V::kGroups;
  if constexpr (V::kWholeFloat3 && std::is_same_v<typename M::In, Packed<uint8_t, 3>> &&
                std::is_same_v<typename M::Out, Packed<uint8_t, 3>>) {
    // Eight pixels of three bytes: one load and one shuffle a channel, the
    // clamped results back the same way.
    for (; x + kStep <= end; x += kStep) {
      F colour[3];
      I hls[3];
      in.template readAhead<kStep>(x);
      V::loadBytes3(in.pixel(x), colour);
      forwardLanes<V, typename M::BodyRecipe>(colour[M::kRedAt], colour[1], colour[2 - M::kRedAt], hls);
      V::storeBytes3(out.pixel(x), hls);
    }
    return x;
  } else {
    const __m128i bias = _mm_set1_epi32(0x8000);
    for (; x + kStep <= end; x += kStep) {
      __m128i raw[V::kGroups][4];
      in.template readAhead<kStep>(x);
      for (int k = 0; k < V::kGroups; ++k) {
        in.template load<M::kChannels>(x + 4 * k, raw[k]);
        if constexpr (M::kBiased)
          for (int c = 0; c < 3; ++c) raw[k][c] = _mm_xor_si128(raw[k][c], bias);
      }
      F colour[3];
      for (int c = 0; c < 3; ++c) {
        __m128i parts[V::kGroups];
        for (int k = 0; k < V::kGroups; ++k) parts[k] = raw[k][c];
        colour[c] = V::toFloat(V::join(parts));
      }
      I hls[3];
      forwardLanes<V, typename M::BodyRecipe>(colour[M::kRedAt], colour[1], colour[2 - M::kRedAt], hls);
      for (int k = 0; k < V::kGroups; ++k) {
        __m128i lanes[4] = {V::part(hls[0], k), V::part(hls[1], k), V::part(hls[2], k), raw[k][3]};
        if constexpr (M::kBiased)
          for (int c = 0; c < 3; ++c) lanes[c] = _mm_xor_si128(lanes[c], bias);
        out.template store<M::kCopyAlpha ? 4 : 3>(x + 4 * k, lanes);
      }
    }
    return x;
  }
}

// Float samples: the one formula of every pixel, with true divisions.
template <class V>
inline void forwardFloatLanes(typename V::F r, typename V::F g, typename V::F b, typename V::F* out) {
  using F = typename V::F;
  using M = typename V::M;
  const F zero = V::set(0.0f), half = V::set(0.5f);
  const F mx = V::max(V::max(r, g), b), mn = V::min(V::min(r, g), b);
  const F spread = V::sub(mx, mn), sum = V::add(mx, mn);
  const F light = V::mul(sum, half);
  const M flat = V::le(spread, V::set(kFlatLimit));
  // One division with the divisor chosen first: the same quotient as
  // choosing between the two.
  const F sat = V::divUnless(flat, spread, V::select(V::le(light, half), sum, V::sub(V::set(2.0f), sum)));
  const M isR = V::eq(r, mx);
  const M isG = V::maskAndNot(isR, V::eq(g, mx));
  // The difference of the branch taken: R - G, replaced by B - R where G
  // wins and by G - B where R does.
  const F diff = V::subWhere(isR, V::subWhere(isG, V::sub(r, g), b, r), g, b);
  F hue = V::div(V::mul(diff, V::set(60.0f)), spread);
  // Adding a zero base would turn -0 into +0: the red branch adds nothing.
  hue = V::addUnless(isR, hue, hue, V::select(isG, V::set(120.0f), V::set(240.0f)));
  hue = V::addWhere(V::lt(hue, zero), hue, hue, V::set(360.0f));
  out[0] = V::divUnless(flat, hue, V::set(360.0f));
  out[1] = light;
  out[2] = sat;
}

// Groups from x while they fit below `end`; whole three-float pixels store
// as `how` says (the others plainly).
template <class V, class In, class Out>
inline int forwardFloatGroups(const In& in, const Out& out, int x, int end, RowStores how = {}) {
  constexpr int kStep = 4 * V::kGroups;
  if constexpr (V::kWholeFloat3 && In::kChannels == 3) {
    // Whole pixels of three floats: three vectors in, three out.
    for (; x + kStep <= end; x += kStep) {
      typename V::F colour[3], hls[3];
      in.template readAhead<kStep>(x);
      V::getFloat3(how, in.pixel(x), colour);
      forwardFloatLanes<V>(colour[0], colour[1], colour[2], hls);
      V::putFloat3(how, out.pixel(x), hls);
    }
    return x;
  } else {
    for (; x + kStep <= end; x += kStep) {
      __m128i raw[V::kGroups][4];
      in.template readAhead<kStep>(x);
      for (int k = 0; k < V::kGroups; ++k) in.template load<3>(x + 4 * k, raw[k]);
      typename V::F colour[3], hls[3];
      for (int c = 0; c < 3; ++c) {
        __m128i parts[V::kGroups];
        for (int k = 0; k < V::kGroups; ++k) parts[k] = raw[k][c];
        colour[c] = V::asFloat(V::join(parts));
      }
      forwardFloatLanes<V>(colour[0], colour[1], colour[2], hls);
      for (int k = 0; k < V::kGroups; ++k) {
        const __m128i lanes[3] = {V::part(V::asInt(hls[0]), k), V::part(V::asInt(hls[1]), k),
                                  V::part(V::asInt(hls[2]), k)};
        out.template store<3>(x + 4 * k, lanes);
      }
    }
    return x;
  }
}

// ---- inverse ----

template <class V, class R>
inline typename V::F riseLanes(typename V::F low, typename V::F dm, typename V::F h) {
  if constexpr (R::kBand == Band::ProductFirst) return V::add(low, V::mul(V::mul(dm, h), V::set(kInv60)));
  else if constexpr (R::kBand == Band::RateFirst) return V::add(low, V::mul(V::mul(h, V::set(kInv60)), dm));
  else return V::add(low, V::div(V::mul(dm, h), V::set(60.0f)));
}

template <class V, class R>
inline typename V::F levelLanes(typename V::F h, typename V::F low, typename V::F high, typename V::F dm) {
  using F = typename V::F;
  using M = typename V::M;
  // The two sloped bands are one formula of their distance from the band's
  // low end: h below 60, 240 - h from 180 to 240. That distance is chosen
  // first and the slope evaluated once.
  // Tested as "not below 60" (NaN included): the distance and the last
  // choice both read that one mask.
  const M past60 = V::notLess(h, V::set(60.0f));
  const F rise = riseLanes<V, R>(low, dm, V::subWhere(past60, h, V::set(240.0f), h));
  F v = V::select(V::lt(h, V::set(240.0f)), rise, low);
  v = V::select(V::lt(h, V::set(180.0f)), high, v);
  return V::select(past60, v, rise);
}

// Levels of R, G, B from hue in degrees, l and s.
template <class V, class R>
inline void levelLanesOf(typename V::F h, typename V::F l, typename V::F s, typename V::F* level) {
  using F = typename V::F;
  const F half = V::set(0.5f), one = V::set(1.0f);
  const typename V::M lower = V::le(l, half);
  const F ls = V::mul(l, s);
  F high;
  if constexpr (R::kHigh == High::Split) high = V::add(l, V::select(lower, ls, V::sub(s, ls)));
  else if constexpr (R::kHigh == High::Plain) high = V::select(lower, V::add(l, ls), V::sub(V::add(l, s), ls));
  else high = V::select(lower, V::mul(l, V::add(s, one)), V::sub(V::add(l, s), ls));
  const F low = V::sub(V::add(l, l), high);
  const F dm = V::sub(high, low);
  const F full = V::set(360.0f), third = V::set(120.0f), zero = V::set(0.0f);
  F hr = V::add(h, third);
  hr = V::subWhere(V::gt(hr, full), hr, hr, full);
  F hb = V::sub(h, third);
  hb = V::addWhere(V::lt(hb, zero), hb, hb, full);
  level[0] = levelLanes<V, R>(hr, low, high, dm);
  level[1] = levelLanes<V, R>(h, low, high, dm);
  level[2] = levelLanes<V, R>(hb, low, high, dm);
}

template <class V, class R>
inline typename V::I outputLanes(typename V::F level) {
  const typename V::F v = V::mul(level, V::set(R::kRange));
  if constexpr (R::kOutput == Output::RoundSaturate) return V::clamp(V::round(v), R::kMax);
  else if constexpr (R::kOutput == Output::TruncateSaturate) return V::clamp(V::truncate(v), R::kMax);
  else if constexpr (R::kOutput == Output::RoundLow) return V::lowBits(V::round(v), R::kMax);
  else if constexpr (R::kOutput == Output::TruncateLow) return V::lowBits(V::truncate(v), R::kMax);
  else return V::asInt(level);
}

template <class V, class M>
inline int inverseGroups(const typename M::In& in, const typename M::Out& out, int x, int end, RowStores how = {}) {
  using F = typename V::F;
  using I = typename V::I;
  using R = typename M::BodyRecipe;
  static_assert(R::kGrey != Grey::CopyL || R::kOutput == Output::Level, "blocks copy L only as a float");
  constexpr int kStep = 4 * V::kGroups;
  if constexpr (V::kWholeFloat3 && M::kFloat && M::In::kChannels == 3 && M::Out::kChannels == 3) {
    static_assert(R::kScale == Scale::Float && R::kGrey == Grey::CopyL && R::kOutput == Output::Level);
    // Two groups a turn: the second's loads and first steps overlap the
    // first's long chain of dependent steps.
#pragma GCC unroll 2
    for (; x + kStep <= end; x += kStep) {
      F hls[3], level[3];
      in.template readAhead<kStep>(x);
      V::getFloat3(how, in.pixel(x), hls);
      const F h = V::mul(hls[0], V::set(360.0f)), l = hls[1], s = hls[2];
      levelLanesOf<V, R>(h, l, s, level);
      const typename V::M grey = V::eq(s, V::set(0.0f));
      F rgb[3];
      for (int c = 0; c < 3; ++c) rgb[c] = V::select(grey, hls[1], level[c]);
      const F ordered[3] = {rgb[M::kRedAt], rgb[1], rgb[2 - M::kRedAt]};
      V::putFloat3(how, out.pixel(x), ordered);
    }
    return x;
  } else {
    const __m128i bias = _mm_set1_epi32(0x8000);
    for (; x + kStep <= end; x += kStep) {
      __m128i raw[V::kGroups][4];
      in.template readAhead<kStep>(x);
      for (int k = 0; k < V::kGroups; ++k) {
        in.template load<M::kChannels>(x + 4 * k, raw[k]);
        if constexpr (M::kBiased)
          for (int c = 0; c < 3; ++c) raw[k][c] = _mm_xor_si128(raw[k][c], bias);
      }
      F hls[3];
      for (int c = 0; c < 3; ++c) {
        __m128i parts[V::kGroups];
        for (int k = 0; k < V::kGroups; ++k) parts[k] = raw[k][c];
        hls[c] = M::kFloat ? V::asFloat(V::join(parts)) : V::toFloat(V::join(parts));
      }
      F h, l, s;
      if constexpr (R::kScale == Scale::Multiply8) {
        h = V::mul(hls[0], V::set(kDeg8)), l = V::mul(hls[1], V::set(kInv8)), s = V::mul(hls[2], V::set(kInv8));
      } else if constexpr (R::kScale == Scale::Multiply16) {
        h = V::mul(hls[0], V::set(kDeg16)), l = V::mul(hls[1], V::set(kInv16)), s = V::mul(hls[2], V::set(kInv16));
      } else if constexpr (R::kScale == Scale::Divide8) {
        h = V::div(V::mul(hls[0], V::set(360.0f)), V::set(255.0f));
        l = V::div(hls[1], V::set(255.0f)), s = V::div(hls[2], V::set(255.0f));
      } else {
        h = V::mul(hls[0], V::set(360.0f)), l = hls[1], s = hls[2];
      }
      F level[3];
      levelLanesOf<V, R>(h, l, s, level);
      const typename V::M grey = V::eq(s, V::set(0.0f));
      I rgb[3];
      for (int c = 0; c < 3; ++c) {
        if constexpr (R::kGrey == Grey::Lightness) level[c] = V::select(grey, l, level[c]);
        if constexpr (R::kGrey == Grey::CopyL) level[c] = V::select(grey, hls[1], level[c]);
        rgb[c] = outputLanes<V, R>(level[c]);
      }
      for (int k = 0; k < V::kGroups; ++k) {
        __m128i lanes[4] = {V::part(rgb[M::kRedAt], k), V::part(rgb[1], k), V::part(rgb[2 - M::kRedAt], k), raw[k][3]};
        if constexpr (M::kBiased)
          for (int c = 0; c < 3; ++c) lanes[c] = _mm_xor_si128(lanes[c], bias);
        out.template store<M::kCopyAlpha ? 4 : 3>(x + 4 * k, lanes);
      }
    }
    return x;
  }
}
