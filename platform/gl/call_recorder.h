// GlDevice's call log. It is the reference device's journal (platform/memory_journal.h), written
// with the same names and argument conventions, so the same calls give the same log on both
// devices. Every function here swallows allocation failure: a log entry is lost rather than an
// exception let out into the caller.
#pragma once

#include <cstdint>
#include <initializer_list>

#include "platform/memory_journal.h"

void LogCall(DeviceJournal& journal, const char* name,
             std::initializer_list<std::uint64_t> args) noexcept;
// The matrix by value, row by row, as float bit patterns; only the state when null.
void LogSetTransform(DeviceJournal& journal, D3DTRANSFORMSTATETYPE state,
                     const D3DMATRIX* matrix) noexcept;
// The six fields; no arguments when null.
void LogSetViewport(DeviceJournal& journal, const D3DVIEWPORT9* viewport) noexcept;
// The count, then each rectangle's four corners (when rects is not null), flags, colour, z bits
// and stencil.
void LogClear(DeviceJournal& journal, DWORD count, const D3DRECT* rects, DWORD flags,
              D3DCOLOR color, float z, DWORD stencil) noexcept;
// Texture id, level, the rectangle (the whole level for a null one) and flags.
void LogLockRect(DeviceJournal& journal, const void* texture, UINT level, const RECT& area,
                 DWORD flags) noexcept;
