// Everything of the library but its components, which have headers of their own (<orv/json.hpp>).
#pragma once

#include <orv/all_messages.hpp>
#include <orv/binary_decoder.hpp>
#include <orv/binary_encoder.hpp>
#include <orv/decode_limits.hpp>
#include <orv/delimited_parser.hpp>
#include <orv/delimited_stream.hpp>
