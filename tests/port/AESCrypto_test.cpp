// SPDX-License-Identifier: Apache-2.0
#include "AESCrypto.h"

#include <algorithm>
#include <cctype>
#include <cstdlib>
#include <filesystem>

#include <gmock/gmock.h>
#include <openssl/err.h>
#include <openssl/evp.h>
#include <sys/stat.h>
#include <unistd.h>

#include "support/Program.h"
#include "support/TemporaryTree.h"
#include "support/Together.h"

using testing::AllOf;
using testing::HasSubstr;
using testing::Not;

namespace {

const std::string HEX_KEY = "000102030405060708090a0b0c0d0e0f101112131415161718191a1b1c1d1e1f";

const std::string BASE64 = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/=";

AESCrypto& cipher()
{
    return *AESCrypto::GetInstance();
}

std::string fromHex(const std::string& digits)
{
    std::string bytes;
    for (std::size_t i = 0; i < digits.size(); i += 2)
        bytes += static_cast<char>(std::stoi(digits.substr(i, 2), nullptr, 16));
    return bytes;
}

const unsigned char* bytesOf(const std::string& text)
{
    return reinterpret_cast<const unsigned char*>(text.data());
}

std::string base64(const std::string& data)
{
    std::string text(data.size() * 2 + 8, '\0');
    text.resize(
        static_cast<std::size_t>(EVP_EncodeBlock(reinterpret_cast<unsigned char*>(text.data()),
                                                 bytesOf(data), static_cast<int>(data.size()))));
    return text;
}

class AESCryptoTest : public testing::Test {
protected:
    AESCryptoTest()
    {
        cipher().SetKey(bytesOf(fromHex(HEX_KEY)));
    }

    std::string loadProblem(const std::string& path)
    {
        std::string problem;
        EXPECT_FALSE(cipher().LoadKeyFile(path.c_str(), problem)) << path;
        return problem;
    }

    const TemporaryTree tree;
};

std::string open(const std::string& enciphered)
{
    std::string plain = "untouched";
    EXPECT_TRUE(cipher().Decrypt(enciphered, plain));
    return plain;
}

bool isRefused(const std::string& enciphered)
{
    std::string plain = "untouched";
    return !cipher().Decrypt(enciphered, plain) && plain == "untouched";
}

// What another process makes of "balance" with a key file of its environment.
std::string probeWithKey(const std::string& path)
{
    return outputOf("CORESYSTEM_LOG_KEY=" + path + " " QUOTED_ENVIRONMENT_PROBE " balance");
}

std::string encipheredIn(const std::string& output)
{
    const std::size_t begin = output.find("enciphered=") + 11;
    return output.substr(begin, output.find('\n', begin) - begin);
}

TEST_F(AESCryptoTest, WhatWasEncipheredCanBeRead)
{
    for (const std::string& plain : {std::string(), std::string("a"), std::string("a\0b", 3),
                                     std::string(598, 'x'), std::string(100000, '\xff')})
        EXPECT_EQ(plain, open(cipher().Encrypt(plain)));
}

TEST_F(AESCryptoTest, PublishedTestCasesCanBeRead)
{
    // Test cases 14 and 15 of "The Galois/Counter Mode of Operation" (McGrew, Viega).
    const struct {
        std::string key, nonce, plain, sealed, tag;
    } cases[] = {
        {std::string(64, '0'), std::string(24, '0'), std::string(32, '0'),
         "cea7403d4d606b6e074ec5d3baf39d18", "d0d1c8a799996bf0265b98b5d48ab919"},
        {"feffe9928665731c6d6a8f9467308308feffe9928665731c6d6a8f9467308308",
         "cafebabefacedbaddecaf888",
         "d9313225f88406e5a55909c5aff5269a86a7a9531534f7da2e4c303d8a318a72"
         "1c3c0c95956809532fcf0e2449a6b525b16aedf5aa0de657ba637b391aafd255",
         "522dc1f099567d07f47f37a32a84427d643a8cdcbfe5c0c97598a2bd2555d1aa"
         "8cb08e48590dbb3da7b08b1056828838c5f61e6393ba7a0abcc9f662898015ad",
         "b094dac5d93471bdec1a502270e3cc6c"},
    };
    for (const auto& published : cases) {
        cipher().SetKey(bytesOf(fromHex(published.key)));
        EXPECT_EQ(fromHex(published.plain),
                  open(base64(fromHex(published.nonce + published.sealed + published.tag))));
    }
}

TEST_F(AESCryptoTest, EncipheredTextIsPrintableTellsNothingAndDiffersEachTime)
{
    std::set<std::string> texts;
    for (int i = 0; i < 100; ++i) {
        const std::string text = cipher().Encrypt("310260123456789");
        EXPECT_EQ(std::string::npos, text.find_first_not_of(BASE64)) << text;
        EXPECT_THAT(text, Not(HasSubstr("310260")));
        texts.insert(text);
    }
    EXPECT_EQ(100U, texts.size());
}

TEST_F(AESCryptoTest, AnyChangedCharacterIsRefused)
{
    const std::string text = cipher().Encrypt("balance");
    for (std::size_t i = 0; i < text.size(); ++i)
        for (const char other : BASE64 + " \n") {
            std::string changed = text;
            changed[i] = other;
            EXPECT_EQ(changed != text, isRefused(changed)) << i << ": " << other;
        }
}

TEST_F(AESCryptoTest, ShortenedAndLengthenedTextsAreRefused)
{
    const std::string text = cipher().Encrypt("balance");
    for (std::size_t size = 0; size < text.size(); ++size)
        EXPECT_TRUE(isRefused(text.substr(0, size))) << size;
    for (const char* const more : {"A", "AAAA", "====", " ", "\n", "    "})
        EXPECT_TRUE(isRefused(text + more) && isRefused(more + text)) << more;
    EXPECT_TRUE(isRefused("no base64!!!"));
    EXPECT_TRUE(isRefused("===="));
}

TEST_F(AESCryptoTest, AnotherKeyReadsNothing)
{
    const std::string text = cipher().Encrypt("balance");
    cipher().SetKey(bytesOf(std::string(AESCrypto::KEY_SIZE, 'k')));
    EXPECT_TRUE(isRefused(text));
}

TEST_F(AESCryptoTest, GoodKeyFilesHoldTheSameKey)
{
    const std::string text = cipher().Encrypt("balance");
    std::string upper = HEX_KEY;
    std::transform(upper.begin(), upper.end(), upper.begin(), ::toupper);
    for (const std::string& content :
         {fromHex(HEX_KEY), HEX_KEY, HEX_KEY + "\n", HEX_KEY + " \t\r\n\n", upper}) {
        std::string problem = "untouched";
        cipher().SetKey(bytesOf(std::string(AESCrypto::KEY_SIZE, 'k')));
        EXPECT_TRUE(cipher().LoadKeyFile(tree.write("/key", content).c_str(), problem)) << problem;
        EXPECT_EQ("balance", open(text));
    }
}

TEST_F(AESCryptoTest, BadKeyFilesAreNamedAndLeaveTheKey)
{
    const std::string text = cipher().Encrypt("balance");
    for (const std::string& content :
         {std::string(), std::string(31, 'k'), std::string(33, 'k'), HEX_KEY.substr(1),
          HEX_KEY + "0", "0x" + HEX_KEY.substr(2), "g" + HEX_KEY.substr(1),
          HEX_KEY.substr(1) + std::string(1, '\0'), " " + HEX_KEY, HEX_KEY + "\n" + HEX_KEY}) {
        const std::string path = tree.write("/key", content);
        EXPECT_EQ("key file " + path + ": a key is 32 bytes or 64 hexadecimal digits",
                  loadProblem(path));
    }
    EXPECT_EQ("balance", open(text));
}

TEST_F(AESCryptoTest, FilesThatAreNoKeyFilesAreNamedAtOnce)
{
    const std::string fifo = tree.path("/fifo");
    ASSERT_EQ(0, mkfifo(fifo.c_str(), 0600));
    EXPECT_EQ("key file " + fifo + ": not a regular file", loadProblem(fifo));
    EXPECT_EQ("key file " + tree.root() + ": Is a directory", loadProblem(tree.root()));
    EXPECT_EQ("key file /nowhere: No such file or directory", loadProblem("/nowhere"));
    const std::string big = tree.write("/big", std::string(5000, ' '));
    EXPECT_EQ("key file " + big + ": larger than 4096 bytes", loadProblem(big));
}

TEST_F(AESCryptoTest, UnusableKeyFileOfTheEnvironmentIsNeverReplaced)
{
    const std::string key = tree.write("/key", HEX_KEY.substr(2));
    const std::string why = "key file " + key + ": a key is 32 bytes or 64 hexadecimal digits";
    EXPECT_THAT(probeWithKey(key),
                AllOf(HasSubstr("enciphered=!" + why + "\nconfigured=1\nproblem=" + why),
                      Not(HasSubstr("balance"))));
}

TEST_F(AESCryptoTest, WithoutAKeyEveryProcessMakesItsOwn)
{
    const std::string output =
        outputOf("env -u CORESYSTEM_LOG_KEY " QUOTED_ENVIRONMENT_PROBE " balance");
    EXPECT_THAT(output, AllOf(HasSubstr("\nconfigured=0\nproblem=\n"), Not(HasSubstr("balance"))));
    EXPECT_EQ(48U, encipheredIn(output).size()); // 12 + 7 + 16 bytes
    EXPECT_TRUE(isRefused(encipheredIn(output)));
}

TEST_F(AESCryptoTest, KeyIsInNoOutput)
{
    std::string all;
    for (const std::string& content :
         {HEX_KEY, HEX_KEY.substr(1), HEX_KEY + "zz", fromHex(HEX_KEY)})
        all += probeWithKey(tree.write("/key", content));
    EXPECT_THAT(all, AllOf(HasSubstr("enciphered="), Not(HasSubstr(HEX_KEY.substr(1, 16))),
                           Not(HasSubstr(fromHex(HEX_KEY).substr(16, 8)))));
}

TEST_F(AESCryptoTest, ApplicationsErrorQueueIsLeftAlone)
{
    ERR_clear_error();
    isRefused(cipher().Encrypt("balance").replace(20, 1, "!"));
    loadProblem(tree.write("/key", "g" + HEX_KEY.substr(1)));
    EXPECT_EQ(0U, ERR_peek_error());
}

// Loaded by a relative path, by a program that changes its folder afterwards: this one, started
// again.
TEST_F(AESCryptoTest, ModuleStandsBesideTheLibraryWhereverTheProgramGoes)
{
    if (std::getenv("STARTED_AGAIN") != nullptr) {
        ASSERT_EQ(0, chdir(tree.root().c_str()));
        std::puts(cipher().GetProblem().empty() ? "there is a cipher" : "there is none");
        return;
    }
    const std::string folder = std::filesystem::path(CIPHER_MODULE).parent_path().parent_path();
    const std::string self = std::filesystem::read_symlink("/proc/self/exe");
    if (PROBE_IS_EMULATED != 0)
        GTEST_SKIP() << "needs a program of this machine";
    EXPECT_THAT(outputOf("cd '" + folder + "' && STARTED_AGAIN=1 LD_LIBRARY_PATH=. '" + self +
                         "' --gtest_filter=*WhereverTheProgramGoes"),
                HasSubstr("there is a cipher\n"));
}

TEST_F(AESCryptoTest, ThreadsMayEncipherAtOnce)
{
    together(8, [](int number) {
        const std::string plain(static_cast<std::size_t>(number) * 70, 'p');
        for (int round = 0; round < 200; ++round) {
            std::string read;
            ASSERT_TRUE(cipher().Decrypt(cipher().Encrypt(plain), read));
            ASSERT_EQ(plain, read);
        }
    });
}

} // namespace
