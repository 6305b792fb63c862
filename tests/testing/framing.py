"""Encodings of Protocol Buffers, written and taken apart without its library, for the tests of programs."""


def varint(number):
    encoded = b""
    while number >= 0x80:
        encoded += bytes([number & 0x7F | 0x80])
        number >>= 7
    return encoded + bytes([number])


def record(number, body):
    return varint(number << 3 | 2) + varint(len(body)) + body


def delimited(*messages):
    return b"".join(varint(len(message)) + message for message in messages)


def read_delimited(data):
    bodies = []
    while data:
        length, shift, at = 0, 0, 0
        while True:
            length |= (data[at] & 0x7F) << shift
            shift += 7
            at += 1
            if data[at - 1] < 0x80:
                break
        assert at + length <= len(data), "the data ends inside a message"
        bodies.append(data[at:at + length])
        data = data[at + length:]
    return bodies
