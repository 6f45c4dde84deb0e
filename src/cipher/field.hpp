#pragma once
// Enciphered catalogue fields and the field key.
//
// An enciphered field text is the value's Windows-1252 bytes, padded and
// enciphered with Blowfish under the field key (blowfish_string.hpp), written
// as uppercase hexadecimal: 16 * (n / 8 + 1) digits for a value of n bytes.
// The same value always gives the same text (one key, no chaining, no salt),
// so an enciphered column can be matched by enciphering the value sought.
//
// The field key is 36 bytes, written as a key text of 72 hexadecimal digits.
// It comes from, in this order: a key the host set (SetFieldKeyText,
// SetFieldKeyFile), the machine-wide key file kFieldKeyFilePath when it
// exists, or the built-in key. The host's key applies to the whole process;
// each thread takes it up when it next runs InitFieldCipher, which each
// editor runs as it loads.

#include <filesystem>
#include <span>
#include <string>
#include <string_view>

namespace belvane::cipher {

inline constexpr std::size_t kFieldKeyBytes = 36;
inline constexpr const char* kFieldKeyFilePath = "/etc/belvane/field-cipher.key";

// The key text of the built-in key.
std::string BuiltInCipherKeyText();

// The key text of the key in force (see above). Raises the errors of
// ReadFieldKeyFile when anything is at the machine-wide key file's path
// (a file, a folder, a link, even one that leads nowhere) but no key can be
// read from it: only a path where nothing is gives the built-in key.
std::string BuildCipherKeyText();
// As above, with the machine-wide key file at `machineKeyFile`.
std::string BuildCipherKeyText(const std::filesystem::path& machineKeyFile);

// A key text with its whitespace removed and its digits in upper case.
// Raises error 13 for a character that is neither whitespace nor a
// hexadecimal digit, error 5 unless exactly 72 digits remain. The messages
// give positions, never key digits.
std::string NormaliseFieldKeyText(std::string_view keyText);

// The normalised key text held in a key file. Raises error 53 when the file
// does not exist (a link that leads nowhere included), 75 when it cannot be
// read, 5 for an empty file name, and the errors of NormaliseFieldKeyText,
// each naming the file. A key file that was named is never passed over.
std::string ReadFieldKeyFile(const std::filesystem::path& path);

// Sets the host's key for the whole process and sets it up on the calling
// thread. On an error the key in force is kept.
void SetFieldKeyText(std::string_view keyText);
void SetFieldKeyFile(const std::filesystem::path& path);

// Drops the host's key. The calling thread is left without a key, so its
// next EncryptField or DecryptField sets up the key then in force.
void ResetFieldKey();

// Sets the field key up as this thread's cipher key. Running it again gives
// the same state. Raises the errors of BuildCipherKeyText, the thread's key
// unchanged.
void InitFieldCipher();

// The enciphered field text of a UTF-8 value. A character that Windows-1252
// cannot hold raises error 5 naming it. Sets the field key up first when no
// key has been set up on this thread.
std::string EncryptField(std::string_view utf8);

// The UTF-8 value of an enciphered field text; the empty text for the empty
// text. The text is taken as it is (no trimming); digits of either case are
// read, and a last digit without a partner is ignored. A digit pair that is
// not hexadecimal raises error 13; a non-empty text of fewer than 16 digits
// raises error 9. A text enciphered under another key gives unreadable
// characters, not an error. Sets the field key up first when no key has been
// set up on this thread.
std::string DecryptField(std::string_view fieldText);

// DecryptField of each of `fieldTexts`, into the element of `values` at the
// same place (their counts must match: error 5 otherwise). The blocks of all
// the texts are deciphered side by side, about twice as fast as one text at
// a time when each value is a block or two, as in a catalogue row. Raises
// what DecryptField raises for the first text it cannot read; the values are
// then unspecified.
void DecryptFields(std::span<const std::string_view> fieldTexts, std::span<std::string> values);

} // namespace belvane::cipher
