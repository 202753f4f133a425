#include "zkLogFile.h"

#include <fcntl.h>

#include <cassert>
#include <cstdio>
#include <ctime>

#include "zkBasicFile.h"
#include "zkFileManager.h"

namespace {

constexpr unsigned kFullYearDigits = 4;
constexpr unsigned kShortYearFrom = 2;
constexpr unsigned kShortYearTo = 3;
constexpr long kOneDigitMax = 9;
constexpr long kTwoDigitsMax = 99;

// The years written with four digits, of which the date shows the last two.
constexpr long kFirstFourDigitYear = 1000;
constexpr long kLastFourDigitYear = 9999;

// Appends n, which lies within [0, 99], as two digits.
void appendTwoDigits(zkStringBase& out, int n) {
    assert(n >= 0 && n <= kTwoDigitsMax);
    out.append(static_cast<char>('0' + n / 10));
    out.append(static_cast<char>('0' + n % 10));
}

}  // namespace

zkLogFile::zkLogFile() : m_options(), m_level(LevelNormal), m_entries(0), m_display(0) {
    SetDefaults();
}

zkLogFile::zkLogFile(const zkStringBase& filename, unsigned clear) : zkLogFile() {
    m_filename = filename;
    if (clear) Clear();
}

zkLogFile::~zkLogFile() = default;

void zkLogFile::SetDefaults() {
    m_options[OptionReserved] = 0;
    m_options[OptionTimeStamp] = 1;
    m_options[OptionEntryNumber] = 0;
}

void zkLogFile::SetFilename(const char* filename, unsigned clear) {
    m_filename = filename;
    m_options[OptionReserved] = 0;
    if (clear) Clear();
}

const char* zkLogFile::GetFilename() const {
    return m_filename.data();
}

unsigned zkLogFile::GetOption(LogOption option) const {
    assert(option < kOptionCount);
    return option < kOptionCount ? m_options[option] : 0;
}

void zkLogFile::SetOption(LogOption option, unsigned value) {
    assert(option < kOptionCount);
    if (option < kOptionCount) m_options[option] = value;
}

void zkLogFile::Log(const char* message, LogLevel level) {
    if (level > m_level) return;
    m_line.makeNull();
    if (m_options[OptionEntryNumber]) {
        GetEntryStamp(m_stamp);
        m_line.append(m_stamp);
    }
    if (m_options[OptionTimeStamp]) {
        GetCurrTimeAndDate(m_stamp, m_date);
        m_line.append(m_stamp).append(' ').append(m_date).append("  ");
    }
    m_line.append(message);
    DoLog(m_line);
}

void zkLogFile::Log(const zkStringBase& message, LogLevel level) {
    Log(message.data(), level);
}

void zkLogFile::Log(const char* text, const char* value, LogLevel level) {
    if (level > m_level) return;
    m_message.makeNull();
    m_message.append(text).append(' ').append(value);
    Log(m_message.data(), level);
}

void zkLogFile::Log(const char* text, long value, LogLevel level) {
    if (level > m_level) return;
    m_message.makeNull();
    m_message.append(text).append(' ').append(value);
    Log(m_message.data(), level);
}

void zkLogFile::DoLog(const zkStringBase& line) {
    // The line and its line feed go out in one write on a descriptor opened
    // for appending, so writers on the same file cannot overwrite or split
    // each other's entries.
    m_record = line;
    m_record.append('\n');
    zkBasicFile file(m_filename.data(), O_CREAT, O_RDWR, O_APPEND | O_CLOEXEC);
    if (file.Open() == 0) {
        file.Write(m_record, nullptr);
        file.Close();
    }
    if (m_display) {
        std::fwrite(line.data(), 1, line.length(), stdout);
        std::fputc('\n', stdout);
        std::fflush(stdout);
        m_display = 0;
    }
}

void zkLogFile::Clear() {
    zkFileManager::DeleteFile(m_filename, 0);
}

void zkLogFile::UseDisplay() {
    m_display = 1;
}

void zkLogFile::GetCurrTimeAndDate(zkStringBase& time, zkStringBase& date) {
    time.makeNull();
    date.makeNull();
    std::time_t now = std::time(nullptr);
    struct tm local;
    if (now == static_cast<std::time_t>(-1) || localtime_r(&now, &local) == nullptr) return;

    // The fields of a calendar time all lie within [0, 99], where two digits
    // are exactly what MakeTDNum gives; they are written directly, without
    // formatting a number each.
    appendTwoDigits(time, local.tm_hour);
    time.append(':');
    appendTwoDigits(time, local.tm_min);
    time.append(':');
    appendTwoDigits(time, local.tm_sec);

    appendTwoDigits(date, local.tm_mon + 1);
    date.append('/');
    appendTwoDigits(date, local.tm_mday);
    date.append('/');
    const long year = static_cast<long>(local.tm_year) + 1900;
    if (year >= kFirstFourDigitYear && year <= kLastFourDigitYear) {
        appendTwoDigits(date, static_cast<int>(year % 100));
    } else {
        MakeTDNum(m_number, year, 0);
        if (m_number.length() == kFullYearDigits) {
            date.appendSubString(m_number, kShortYearFrom, kShortYearTo);
        } else {
            date.append(m_number);
        }
    }
}

void zkLogFile::MakeTDNum(zkStringBase& out, long n, unsigned threeDigits) {
    out.makeNull();
    if (threeDigits) {
        if (n <= kOneDigitMax) {
            out.append("00");
        } else if (n <= kTwoDigitsMax) {
            out.append('0');
        }
    } else if (n <= kOneDigitMax) {
        out.append('0');
    }
    out.append(n);
}

void zkLogFile::GetEntryStamp(zkStringBase& out) {
    // Counted in unsigned arithmetic: after INT_MAX entries the number wraps
    // instead of overflowing.
    m_entries = static_cast<int>(static_cast<unsigned>(m_entries) + 1u);
    out.makeNull();
    out.append(static_cast<long>(m_entries)).append(") ");
}
