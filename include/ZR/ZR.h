// The C++ interface of libzr, whole.
#pragma once

#include <ZR/callback_block.h>
#include <ZR/composite.h>
#include <ZR/depth.h>
#include <ZR/errors.h>
#include <ZR/module.h>
#include <ZR/platform.h>
#include <ZR/slots.h>
#include <ZR/transfer_mode.h>
#include <ZR/vec_pixel.h>
#include <ZR/world.h>
#include <ZR/zr.h>
