/* A program that links the C library alone. */
int main(void)
{
    return 0;
}
