// The Base64 codec on 64 MB: base64_encode and base64_decode against OpenSSL's
// EVP_EncodeBlock and EVP_DecodeBlock, abseil's Base64Escape and
// Base64Unescape, and a plain copy into a new buffer. Every contender produces
// a new output buffer per iteration, as ours does.
#include "bench_register.h"

#include <dwxcore/dwxparse.h>

#include <benchmark/benchmark.h>

#include <stdint.h>
#include <string.h>

#include <string>
#include <vector>

#if DWXBENCH_HAVE_OPENSSL
#include <openssl/evp.h>
#endif
#if DWXBENCH_HAVE_ABSL
#include <absl/strings/escaping.h>
#endif

namespace dwxbench {
namespace {

constexpr size_t kBytes = 64u << 20;

// Random bytes, the same on every run.
const std::vector<unsigned char>& Data() {
    static const std::vector<unsigned char> data = [] {
        std::vector<unsigned char> bytes(kBytes);
        uint64_t state = 0x9E3779B97F4A7C15ull;
        for (unsigned char& byte : bytes) {
            state ^= state << 13;
            state ^= state >> 7;
            state ^= state << 17;
            byte = static_cast<unsigned char>(state >> 24);
        }
        return bytes;
    }();
    return data;
}

const std::string& Text() {
    static const std::string text =
        base64_encode(Data().data(), static_cast<unsigned int>(Data().size()));
    return text;
}

void EncodeOurs(benchmark::State& state) {
    const auto& data = Data();
    for (auto _ : state) {
        std::string text = base64_encode(data.data(), static_cast<unsigned int>(data.size()));
        benchmark::DoNotOptimize(text.data());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * kBytes));
}

void DecodeOurs(benchmark::State& state) {
    const std::string& text = Text();
    for (auto _ : state) {
        std::string bytes = base64_decode(text);
        benchmark::DoNotOptimize(bytes.data());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * kBytes));
}

// The reference: the bytes copied into a new buffer.
void CopyMemcpy(benchmark::State& state) {
    const auto& data = Data();
    for (auto _ : state) {
        std::string copy(reinterpret_cast<const char*>(data.data()), data.size());
        benchmark::DoNotOptimize(copy.data());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * kBytes));
}

#if DWXBENCH_HAVE_OPENSSL
void EncodeOpenSsl(benchmark::State& state) {
    const auto& data = Data();
    for (auto _ : state) {
        // EVP_EncodeBlock writes a terminating NUL after the text.
        std::string text(4 * ((data.size() + 2) / 3) + 1, '\0');
        int length = EVP_EncodeBlock(reinterpret_cast<unsigned char*>(&text[0]), data.data(),
                                     static_cast<int>(data.size()));
        text.resize(static_cast<size_t>(length));
        benchmark::DoNotOptimize(text.data());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * kBytes));
}

void DecodeOpenSsl(benchmark::State& state) {
    const std::string& text = Text();
    for (auto _ : state) {
        std::string bytes(text.size() / 4 * 3, '\0');
        int length = EVP_DecodeBlock(reinterpret_cast<unsigned char*>(&bytes[0]),
                                     reinterpret_cast<const unsigned char*>(text.data()),
                                     static_cast<int>(text.size()));
        // The count includes the bytes that the pad characters stand for.
        size_t pad =
            text.size() >= 2 ? (text[text.size() - 1] == '=') + (text[text.size() - 2] == '=') : 0;
        bytes.resize(static_cast<size_t>(length) - pad);
        benchmark::DoNotOptimize(bytes.data());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * kBytes));
}
#endif

#if DWXBENCH_HAVE_ABSL
void EncodeAbseil(benchmark::State& state) {
    const auto& data = Data();
    const absl::string_view view(reinterpret_cast<const char*>(data.data()), data.size());
    for (auto _ : state) {
        std::string text = absl::Base64Escape(view);
        benchmark::DoNotOptimize(text.data());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * kBytes));
}

void DecodeAbseil(benchmark::State& state) {
    const std::string& text = Text();
    for (auto _ : state) {
        std::string bytes;
        bool ok = absl::Base64Unescape(text, &bytes);
        benchmark::DoNotOptimize(ok);
        benchmark::DoNotOptimize(bytes.data());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * kBytes));
}
#endif

void Register(const char* name, void (*function)(benchmark::State&)) {
    benchmark::RegisterBenchmark(name, function)->Unit(benchmark::kMillisecond);
}

}  // namespace

void RegisterBase64Benchmarks() {
    Register("Base64Encode/ours", EncodeOurs);
    Register("Base64Decode/ours", DecodeOurs);
    Register("Base64Copy/memcpy", CopyMemcpy);
#if DWXBENCH_HAVE_OPENSSL
    Register("Base64Encode/openssl", EncodeOpenSsl);
    Register("Base64Decode/openssl", DecodeOpenSsl);
#endif
#if DWXBENCH_HAVE_ABSL
    Register("Base64Encode/abseil", EncodeAbseil);
    Register("Base64Decode/abseil", DecodeAbseil);
#endif
}

}  // namespace dwxbench
