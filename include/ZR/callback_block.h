/* Names for the entries of the callback block and for the selectors of ZR_GetCallbackAddr.
 *
 * A block is a flat record of 69 function pointers that ZR_GetCallbackBlock fills for a quality and an
 * alpha mode; an entry without a routine is null and is to be tested before it is called. Replacing a
 * slot later does not reach a block made earlier. Usable from C. */
#ifndef ZR_CALLBACK_BLOCK_H
#define ZR_CALLBACK_BLOCK_H

#include <ZR/zr.h>

/* quality */
enum { ZR_Quality_Draft = 0, ZR_Quality_Best = 1 };
/* flags; without it worlds are premultiplied */
enum { ZR_BlockFlag_Straight = 1 };

/* "q": depends on quality, "a": on the alpha mode. */
typedef enum ZR_CallbackEntry {
  ZR_Entry_module0 = 0,
  ZR_Entry_sample = 1,         /* q a */
  ZR_Entry_area_sample = 2,    /* q a */
  ZR_Entry_batch_sampling = 3, /* reports that it is gone */
  ZR_Entry_module1 = 4,
  ZR_Entry_composite_rect = 5, /* q a */
  ZR_Entry_blend = 6,          /* a */
  ZR_Entry_convolve = 7,
  ZR_Entry_copy_bits = 8, /* q a */
  ZR_Entry_fill = 9,
  ZR_Entry_gaussian_kernel = 10,
  ZR_Entry_iterate = 11,
  ZR_Entry_premul = 12,
  ZR_Entry_premul_color = 13,
  ZR_Entry_new_world = 14, /* (ref, width, height, flags, out): flags 1 zeroed, 2 16-bit */
  ZR_Entry_dispose_world = 15,
  ZR_Entry_iterate_origin = 16,
  ZR_Entry_iterate_lut = 17,
  ZR_Entry_transfer_rect = 18,
  ZR_Entry_transform_world = 19,
  ZR_Entry_handle_new = 20, /* ZR_HandleNewFunc and so on, below */
  ZR_Entry_handle_lock = 21,
  ZR_Entry_handle_unlock = 22,
  ZR_Entry_handle_dispose = 23,
  ZR_Entry_get_callback_addr = 24,
  ZR_Entry_app_callback = 25,
  ZR_Entry_atan = 26, /* the C library */
  ZR_Entry_atan2 = 27,
  ZR_Entry_ceil = 28,
  ZR_Entry_cos = 29,
  ZR_Entry_exp = 30,
  ZR_Entry_fabs = 31,
  ZR_Entry_floor = 32,
  ZR_Entry_fmod = 33,
  ZR_Entry_hypot = 34,
  ZR_Entry_log = 35,
  ZR_Entry_log10 = 36,
  ZR_Entry_pow = 37,
  ZR_Entry_sin = 38,
  ZR_Entry_sqrt = 39,
  ZR_Entry_tan = 40,
  ZR_Entry_sprintf = 41,
  ZR_Entry_strcpy = 42,
  ZR_Entry_asin = 43,
  ZR_Entry_acos = 44,
  ZR_Entry_unused45 = 45,
  ZR_Entry_rgb_to_hls = 46, /* a, all eight */
  ZR_Entry_hls_to_rgb = 47,
  ZR_Entry_rgb_to_yiq = 48,
  ZR_Entry_yiq_to_rgb = 49,
  ZR_Entry_luminance = 50,
  ZR_Entry_hue = 51,
  ZR_Entry_lightness = 52,
  ZR_Entry_saturation = 53,
  ZR_Entry_platform_query = 54,
  ZR_Entry_handle_size = 55,
  ZR_Entry_iterate_origin_no_clip = 56,
  ZR_Entry_iterate_generic = 57,
  ZR_Entry_handle_resize = 58,
  ZR_Entry_sample16 = 59,      /* q a; null at best quality, premultiplied: there is none */
  ZR_Entry_area_sample16 = 60, /* q a; the same */
  ZR_Entry_fill16 = 61,
  ZR_Entry_premul_color16 = 62,
  ZR_Entry_iterate16 = 63,
  ZR_Entry_iterate_origin16 = 64,
  ZR_Entry_iterate_origin_no_clip16 = 65,
  ZR_Entry_get_pixel_data8 = 66,
  ZR_Entry_get_pixel_data16 = 67,
  ZR_Entry_unused68 = 68
} ZR_CallbackEntry;

enum { ZR_CallbackEntryCount = 69 };

/* -10, -7 and 0 are not selectors. */
typedef enum ZR_CallbackSelector {
  ZR_Selector_box_blur_deep_uno_scan = -13,
  ZR_Selector_bilinear_no_clip8 = -12,
  ZR_Selector_bilinear_plus8 = -11,
  ZR_Selector_bilinear_translate_no_clip8 = -9,
  ZR_Selector_sample_compute_weight = -8,
  ZR_Selector_box_blur_uno_scan = -6,
  ZR_Selector_gaussian_value = -5,
  ZR_Selector_insert_planes = -4,
  ZR_Selector_extract_planes = -3,
  ZR_Selector_fast_blur = -2, /* a */
  ZR_Selector_paint_spot = -1,
  ZR_Selector_module0 = 1,
  ZR_Selector_sample = 2,      /* q a */
  ZR_Selector_area_sample = 3, /* q a */
  ZR_Selector_batch_sampling = 4,
  ZR_Selector_module1 = 5,
  ZR_Selector_composite_rect = 6, /* q a */
  ZR_Selector_blend = 7,          /* a */
  ZR_Selector_convolve = 8,
  ZR_Selector_copy_bits = 9, /* q a */
  ZR_Selector_fill = 10,
  ZR_Selector_gaussian_kernel = 11,
  ZR_Selector_iterate = 12,
  ZR_Selector_premul = 13,
  ZR_Selector_premul_color = 14,
  ZR_Selector_rgb_to_hls = 15, /* a, all eight */
  ZR_Selector_hls_to_rgb = 16,
  ZR_Selector_rgb_to_yiq = 17,
  ZR_Selector_yiq_to_rgb = 18,
  ZR_Selector_luminance = 19,
  ZR_Selector_hue = 20,
  ZR_Selector_lightness = 21,
  ZR_Selector_saturation = 22,
  ZR_Selector_new_world = 23,
  ZR_Selector_dispose_world = 24,
  ZR_Selector_iterate_origin = 25,
  ZR_Selector_iterate_lut = 26,
  ZR_Selector_transfer_rect = 27,
  ZR_Selector_transform_world = 28,
  ZR_Selector_iterate_origin_no_clip = 29,
  ZR_Selector_iterate_generic = 30,
  ZR_Selector_sample16 = 31,      /* q */
  ZR_Selector_area_sample16 = 32, /* q; draft: the nearest pixel, there is no draft area */
  ZR_Selector_fill16 = 33,
  ZR_Selector_premul_color16 = 34,
  ZR_Selector_iterate16 = 35,
  ZR_Selector_iterate_origin16 = 36,
  ZR_Selector_iterate_origin_no_clip16 = 37
} ZR_CallbackSelector;

/* Handles: relocatable blocks, one dereference gives the block. Any thread; one handle at a time. */
typedef void** (*ZR_HandleNewFunc)(i32 size);        /* null when memory is short or size negative; no message */
typedef void* (*ZR_HandleLockFunc)(void** handle);   /* the block; pins nothing; null for null */
typedef void (*ZR_HandleUnlockFunc)(void** handle);  /* no effect */
typedef void (*ZR_HandleDisposeFunc)(void** handle); /* null is nothing */
typedef u64 (*ZR_HandleSizeFunc)(void** handle);     /* bytes; 0 for null */
/* Keeps the contents. 0, 4 without a message, or 3 for a null handle or a negative size. */
typedef i32 (*ZR_HandleResizeFunc)(void** handle, i32 size);

/* kind 0 stores the host's main window. Every kind reports a bad parameter and returns 516, kind 0 too:
 * callers that want the window do not look at the result. */
typedef i32 (*ZR_PlatformQueryFunc)(void* ref, i32 kind, void** out);

#endif
