// The variants of model::render2, each made of five switches: point lights, distance fog, height fog, colour target,
// depth target. Without a colour target there is none without depth either.
#pragma once

// VISIT(pointlit, distancefog, heightfog, colour, depth). The two halves are compiled apart.
#define VELMARK5_MODEL_VARIANTS_PLAIN(VISIT) \
  VISIT(false, false, false, true, false)    \
  VISIT(false, false, false, true, true)     \
  VISIT(false, false, true, true, false)     \
  VISIT(false, false, true, true, true)      \
  VISIT(false, true, false, true, false)     \
  VISIT(false, true, false, true, true)      \
  VISIT(false, true, true, true, false)      \
  VISIT(false, true, true, true, true)       \
  VISIT(false, false, false, false, true)    \
  VISIT(false, false, true, false, true)     \
  VISIT(false, true, false, false, true)     \
  VISIT(false, true, true, false, true)

#define VELMARK5_MODEL_VARIANTS_POINTLIT(VISIT) \
  VISIT(true, false, false, true, false)        \
  VISIT(true, false, false, true, true)         \
  VISIT(true, false, true, true, false)         \
  VISIT(true, false, true, true, true)          \
  VISIT(true, true, false, true, false)         \
  VISIT(true, true, false, true, true)          \
  VISIT(true, true, true, true, false)          \
  VISIT(true, true, true, true, true)           \
  VISIT(true, false, false, false, true)        \
  VISIT(true, false, true, false, true)         \
  VISIT(true, true, false, false, true)         \
  VISIT(true, true, true, false, true)

#define VELMARK5_MODEL_VARIANTS(VISIT) \
  VELMARK5_MODEL_VARIANTS_PLAIN(VISIT) \
  VELMARK5_MODEL_VARIANTS_POINTLIT(VISIT)
