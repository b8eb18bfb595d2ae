#pragma once

#include <QStringList>

#include <map>

/// A word with which plug-ins name a category, and the category's name in `CategoryTable`.
struct CategoryWord {
    const char *word;
    const char *category;
};

/// The words of one format. Immutable: any thread may ask.
class CategoryWords {
public:
    template <std::size_t Size>
    explicit CategoryWords(const CategoryWord (&words)[Size])
    {
        for (const CategoryWord &word : words)
            add(word);
    }

    /// The category set, in its internal form, that whole words stand for; others are ignored.
    quint32 categoryOf(const QStringList &words) const;

private:
    void add(const CategoryWord &word);

    std::map<QString, quint32> m_bits;
};
