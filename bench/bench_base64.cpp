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
#include <utility>
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

bool SameAsData(const std::string& bytes) {
    return bytes.size() == Data().size() && memcmp(bytes.data(), Data().data(), bytes.size()) == 0;
}

const std::string& Text() {
    static const std::string text =
        base64_encode(Data().data(), static_cast<unsigned int>(Data().size()));
    return text;
}

// Each contender's last output is checked once after the timing loop, so
// that every figure belongs to a correct result.
void Check(benchmark::State& state, const std::string& result, bool encoded) {
    if (encoded ? result != Text() : !SameAsData(result)) {
        state.SkipWithError("wrong result");
    }
}

void EncodeOurs(benchmark::State& state) {
    const auto& data = Data();
    std::string result;
    for (auto _ : state) {
        result = base64_encode(data.data(), static_cast<unsigned int>(data.size()));
        benchmark::DoNotOptimize(result.data());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * kBytes));
    Check(state, result, true);
}

void DecodeOurs(benchmark::State& state) {
    const std::string& text = Text();
    std::string result;
    for (auto _ : state) {
        result = base64_decode(text);
        benchmark::DoNotOptimize(result.data());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * kBytes));
    Check(state, result, false);
}

// The reference: the bytes copied into a new buffer.
void CopyMemcpy(benchmark::State& state) {
    const auto& data = Data();
    std::string result;
    for (auto _ : state) {
        result = std::string(reinterpret_cast<const char*>(data.data()), data.size());
        benchmark::DoNotOptimize(result.data());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * kBytes));
    Check(state, result, false);
}

#if DWXBENCH_HAVE_OPENSSL
void EncodeOpenSsl(benchmark::State& state) {
    const auto& data = Data();
    std::string result;
    for (auto _ : state) {
        // EVP_EncodeBlock writes a terminating NUL after the text.
        std::string text(4 * ((data.size() + 2) / 3) + 1, '\0');
        int length = EVP_EncodeBlock(reinterpret_cast<unsigned char*>(&text[0]), data.data(),
                                     static_cast<int>(data.size()));
        text.resize(static_cast<size_t>(length));
        result = std::move(text);
        benchmark::DoNotOptimize(result.data());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * kBytes));
    Check(state, result, true);
}

void DecodeOpenSsl(benchmark::State& state) {
    const std::string& text = Text();
    // EVP_DecodeBlock counts the bytes that the pad characters stand for.
    const size_t pad = (text.size() >= 1 && text[text.size() - 1] == '=') +
                       (text.size() >= 2 && text[text.size() - 2] == '=');
    std::string result;
    for (auto _ : state) {
        std::string bytes(text.size() / 4 * 3, '\0');
        int length = EVP_DecodeBlock(reinterpret_cast<unsigned char*>(&bytes[0]),
                                     reinterpret_cast<const unsigned char*>(text.data()),
                                     static_cast<int>(text.size()));
        bytes.resize(length > 0 ? static_cast<size_t>(length) - pad : 0);
        result = std::move(bytes);
        benchmark::DoNotOptimize(result.data());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * kBytes));
    Check(state, result, false);
}
#endif

#if DWXBENCH_HAVE_ABSL
void EncodeAbseil(benchmark::State& state) {
    const auto& data = Data();
    const absl::string_view view(reinterpret_cast<const char*>(data.data()), data.size());
    std::string result;
    for (auto _ : state) {
        result = absl::Base64Escape(view);
        benchmark::DoNotOptimize(result.data());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * kBytes));
    Check(state, result, true);
}

void DecodeAbseil(benchmark::State& state) {
    const std::string& text = Text();
    std::string result;
    for (auto _ : state) {
        std::string bytes;
        bool ok = absl::Base64Unescape(text, &bytes);
        benchmark::DoNotOptimize(ok);
        result = std::move(bytes);
        benchmark::DoNotOptimize(result.data());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * kBytes));
    Check(state, result, false);
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
