// Reads a fuzzer's input as a stream of small decisions; past the end every
// read gives zero, so any input decodes to some sequence.
#ifndef ZK_FUZZ_INPUT_H
#define ZK_FUZZ_INPUT_H

#include <stddef.h>
#include <stdint.h>
#include <stdio.h>
#include <stdlib.h>

#include <string>

class zkFuzzInput {
public:
    zkFuzzInput(const uint8_t* data, size_t size) : m_data(data), m_size(size) {}

    bool done() const { return m_pos >= m_size; }
    uint8_t byte() { return m_pos < m_size ? m_data[m_pos++] : 0; }
    // Up to `most` bytes, as many as the next byte asks for.
    std::string text(unsigned most) {
        size_t n = byte() % (most + 1);
        if (n > m_size - m_pos) n = m_size - m_pos;
        std::string s(reinterpret_cast<const char*>(m_data + m_pos), n);
        m_pos += n;
        return s;
    }
    std::string rest() {
        std::string s(reinterpret_cast<const char*>(m_data + m_pos), m_size - m_pos);
        m_pos = m_size;
        return s;
    }

private:
    const uint8_t* m_data;
    size_t m_size;
    size_t m_pos = 0;
};

// Stops the run with a message; libFuzzer records the input as a crash.
#define ZK_FUZZ_CHECK(cond)                                                          \
    do {                                                                             \
        if (!(cond)) {                                                               \
            fprintf(stderr, "%s:%d: check failed: %s\n", __FILE__, __LINE__, #cond); \
            abort();                                                                 \
        }                                                                            \
    } while (0)

#endif
