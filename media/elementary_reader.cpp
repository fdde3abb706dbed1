#include "media/elementary_reader.h"

#include "transport/http_stream.h"

namespace vexa {

Result<UnitRead> read_unit(StoppableSocket source, StreamWindow& window, const Codec& codec, GrowingFrame frame,
                           int timeout, const std::function<void(Bytes)>& user_data) {
  const ElementaryCodec& stream = *codec.elementary;
  const auto length = receive_unit(source, window, stream.start_code, frame.room.subspan(frame.length), timeout);
  if (!length) return length.failure();
  if (*length == 0) return UnitRead{UnitRead::Kind::kSilence, 0};
  const Bytes unit = frame.room.subspan(frame.length, static_cast<std::size_t>(*length));
  const UnitKind kind = stream.kind_of(unit);
  if (kind == UnitKind::kUserData) {
    user_data(stream.text_of(unit));
    return UnitRead{UnitRead::Kind::kPart, *length};
  }
  frame.length += static_cast<unsigned int>(*length);
  if (kind == UnitKind::kKeyHeader) frame.frame_type = codec.key_frame;
  if (kind != UnitKind::kPicture) return UnitRead{UnitRead::Kind::kPart, *length};
  if (frame.frame_type != codec.key_frame) frame.frame_type = codec.delta_frame;
  return UnitRead{UnitRead::Kind::kPicture, *length};
}

}  // namespace vexa
