// SPDX-License-Identifier: Apache-2.0
// The functions under test as a table of pointers, so that the same cases run on the shared object,
// on the library's objects, and on a file that something other than the system's loader has loaded.
#pragma once

#include <ovrinresize.h>

// Every function of the public header that touches pixels, or the records and tables behind them.
#define OVRIN_PIXEL_FUNCTIONS(FUNCTION)                \
    FUNCTION(ovrin_resize_rgba8888)                    \
    FUNCTION(ovrin_resize_rgba8888_sg)                 \
    FUNCTION(ovrin_resize_rgba8888_tps)                \
    FUNCTION(ovrin_resize_rgba8888_get_pos)            \
    FUNCTION(_resize_rgba8888_tp)                      \
    FUNCTION(ovrin_resize_rgba8888_keep_ratio)         \
    FUNCTION(ovrin_resize_rgba_keep_ratio_sg)          \
    FUNCTION(ovrin_resize_rgba_keep_ratio_tps)         \
    FUNCTION(ovrin_resize_rgba8888_get_pos_keep_ratio) \
    FUNCTION(_resize_rgba8888_keep_ratio_tp)           \
    FUNCTION(ovrin_resize_rgb888)                      \
    FUNCTION(ovrin_resize_nearest_rgba8888)            \
    FUNCTION(ovrin_resize_yuv420)                      \
    FUNCTION(ovrin_resize_yuv420_sg)                   \
    FUNCTION(ovrin_resize_yuv420_tps)                  \
    FUNCTION(ovrin_resize_yuv420_get_pos)              \
    FUNCTION(_resize_yuv420_tp)                        \
    FUNCTION(ovrin_resize_y_u_v)                       \
    FUNCTION(ovrin_resize_y_u_v_keep_ratio)            \
    FUNCTION(ovrin_resize_y_u_v_sg)                    \
    FUNCTION(ovrin_resize_y_u_v_tps)                   \
    FUNCTION(_resize_y_u_v_tp)                         \
    FUNCTION(ovrin_resize_nv21)                        \
    FUNCTION(ovrin_resize_nv21_sg)                     \
    FUNCTION(ovrin_resize_nv21_tps)                    \
    FUNCTION(ovrin_resize_nv21_get_pos)                \
    FUNCTION(_resize_nv21_tp)                          \
    FUNCTION(ovrin_resize_y_nv21)                      \
    FUNCTION(ovrin_resize_y_nv21_keep_ratio)           \
    FUNCTION(ovrin_resize_y_nv_sg)                     \
    FUNCTION(ovrin_resize_y_nv_tps)                    \
    FUNCTION(_resize_y_nv21_tp)                        \
    FUNCTION(ov_bilinear_sg)                           \
    FUNCTION(ov_bilinear)                              \
    FUNCTION(ov_bilinear_ex)                           \
    FUNCTION(_ov_bilinear_tp)                          \
    FUNCTION(create_lanczos_lookup)                    \
    FUNCTION(checkOvImage)                             \
    FUNCTION(OvTransformLanczos)                       \
    FUNCTION(ov_lanczos)                               \
    FUNCTION(ov_lanczos_nv)                            \
    FUNCTION(ovrin_resize_lanczos)                     \
    FUNCTION(_resize_lanczos_tp)

namespace golden {

struct Api {
#define OVRIN_MEMBER(name) decltype(&::name) name;  // NOLINT(bugprone-macro-parentheses): a member
    OVRIN_PIXEL_FUNCTIONS(OVRIN_MEMBER)
#undef OVRIN_MEMBER
};

// The functions that this program is linked with.
#define OVRIN_LINKED(name) &::name,
#define OVRIN_LINKED_API \
    { OVRIN_PIXEL_FUNCTIONS(OVRIN_LINKED) }

// The functions that find(name) gives. Returns the first name for which there is none, or null.
template <class Find>
const char* look_up(Api& api, const Find& find) {
#define OVRIN_LOOK_UP(name)                                       \
    api.name = reinterpret_cast<decltype(api.name)>(find(#name)); \
    if (api.name == nullptr) return #name;
    OVRIN_PIXEL_FUNCTIONS(OVRIN_LOOK_UP)
#undef OVRIN_LOOK_UP
    return nullptr;
}

}  // namespace golden
