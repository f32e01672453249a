# Files of the repository that are not on the site: the text of a link without the link.
s/\[([^]]*)\]\(\.\.\/[^)]*\)/\1/g
