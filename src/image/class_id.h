// Class identifiers of attachments: those the library itself deals with, and their comparison.
#pragma once

#include <zqvissvc/types.h>

#include <cstring>

namespace zq {

using ClassId = ZqClassId;

inline bool same_class(const ClassId& a, const ClassId& b) {
    return std::memcmp(&a, &b, sizeof(ClassId)) == 0;
}

inline constexpr ClassId kCustomDataAttachment = {
    0xE5457396, 0x3480, 0x4DD0, {0x9C, 0xEA, 0x77, 0xB1, 0x79, 0x14, 0xEC, 0x41}};

// Two attachments that describe an image's geometry; a new size makes them void.
inline constexpr ClassId kGeometryAttachment1 = {
    0x0AAFCF76, 0x8F2F, 0x4044, {0x64, 0xB9, 0xE1, 0x34, 0xE5, 0xC8, 0xE1, 0x34}};
inline constexpr ClassId kGeometryAttachment2 = {
    0x83C29D22, 0x03B0, 0x4F31, {0xCC, 0xA8, 0x34, 0x99, 0x6C, 0x14, 0x34, 0x99}};

}  // namespace zq
