// tools/render/render.h: shared between the render tool's parts.
#pragma once

extern bool RenderStopped;   // the stop rule fired during the last block
