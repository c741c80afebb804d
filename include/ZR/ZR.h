// The C++ interface of libzr, whole.
#pragma once

#include <ZR/blur.h>
#include <ZR/callback_block.h>
#include <ZR/colour_settings.h>
#include <ZR/colour_transform.h>
#include <ZR/composite.h>
#include <ZR/depth.h>
#include <ZR/errors.h>
#include <ZR/guid.h>
#include <ZR/lazy_tiles.h>
#include <ZR/linear_tables.h>
#include <ZR/mask_alpha.h>
#include <ZR/mask_buffer.h>
#include <ZR/module.h>
#include <ZR/platform.h>
#include <ZR/prisma.h>
#include <ZR/slots.h>
#include <ZR/suites.h>
#include <ZR/summed_area.h>
#include <ZR/transfer_mode.h>
#include <ZR/vec_pixel.h>
#include <ZR/viewer_blit.h>
#include <ZR/world.h>
#include <ZR/zr.h>
